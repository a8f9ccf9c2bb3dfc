// SPDX-License-Identifier: BSD-2-Clause
// The control commands for lines: what each changes, announces and refuses.
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "boardplatform/ds1_line.h"
#include "tests/simulator/EventJournal.h"
#include "tests/simulator/LineClock.h"

namespace {

using nlohmann::json;
using support::EventJournal;
using support::LineClock;
using support::readLine;
using testing::ElementsAre;
using testing::IsEmpty;
using namespace std::chrono_literals;

class LineCommandsTest : public testing::Test {
  protected:
    LineCommandsTest() {
        kvlsim::loadChassis(R"(
boards:
  - handle: 5
    attributes: {SERIAL_NUMBER: "S5", NAME: trunks}
    devices:
      - {handle: 51, type: 501, attributes: {NAME: first}, line: {type: esf}}
      - handle: 52
        type: 501
        line: {type: e1-crc, errors: {slips: 0.5}, alarms: [rai], past: {seconds: 60}}
      - {handle: 53, type: 503, attributes: {NAME: voice}}
)");
    }

    static json run(std::string const& command) { return kvlsim::execute(json::parse(command)); }
    static void succeed(std::string const& command) {
        json const reply = run(command);
        EXPECT_EQ(reply["ok"], true) << command << " -> " << reply;
    }

    LineClock clock;
    EventJournal journal;
};

TEST_F(LineCommandsTest, ErrorsCountAtOnceAndAnnounceNothing) {
    succeed(R"({"command": "line-errors", "line": 51, "errors": {"code-violations": 900,
                "path-violations": 5, "framing-errors": 3, "slips": 1}})");
    succeed(R"({"command": "line-errors", "line": "first", "errors": {"slips": 2}})");
    DS1LineCounters const counters = readLine(51);
    EXPECT_EQ(counters.lineCodeViolations, 900U);
    EXPECT_EQ(counters.pathCodeViolations, 5U);
    EXPECT_EQ(counters.framingErrors, 3U);
    EXPECT_EQ(counters.controlledSlips, 3U);
    EXPECT_THAT(journal.take(), IsEmpty());
}

TEST_F(LineCommandsTest, RatesThatAreNotNamedStay) {
    succeed(R"({"command": "line-rates", "line": 52, "rates": {"code-violations": 1.5}})");
    clock.advance(10s);
    EXPECT_EQ(readLine(52).lineCodeViolations, 15U);
    EXPECT_EQ(readLine(52).controlledSlips, 5U);
}

TEST_F(LineCommandsTest, RateCountsFromItsSettingOn) {
    clock.advance(10s);
    succeed(R"({"command": "line-rates", "line": 51, "rates": {"slips": 2}})");
    clock.advance(5s);
    succeed(R"({"command": "line-rates", "line": 51, "rates": {"slips": 0}})");
    clock.advance(5s);
    EXPECT_EQ(readLine(51).controlledSlips, 10U);
}

TEST_F(LineCommandsTest, AlarmIsAnnouncedAsAFaultOfTheBoard) {
    succeed(R"({"command": "line-alarm", "line": 51, "alarm": "los"})");
    EXPECT_EQ(readLine(51).alarms, kDS1AlarmLossOfSignal | kDS1AlarmSendingRemote);
    clock.advance(3s);
    succeed(R"({"command": "line-alarm", "line": 51, "alarm": "los", "clear": true})");
    EXPECT_EQ(readLine(51).alarms, 0U);
    EXPECT_EQ(readLine(51).lossOfSignalSeconds, 3U);
    succeed(R"({"command": "line-alarm", "line": 51, "alarm": "test-code"})");
    EXPECT_THAT(journal.take(), ElementsAre("30001 board 5 value 0100", "30002 board 5 value 0100",
                                            "30001 board 5 value 010A"));
}

TEST_F(LineCommandsTest, AlarmThatIsSoAlreadyAnnouncesNothing) {
    succeed(R"({"command": "line-alarm", "line": 52, "alarm": "rai"})");
    succeed(R"({"command": "line-alarm", "line": 51, "alarm": "rai", "clear": true})");
    EXPECT_THAT(journal.take(), IsEmpty());
    EXPECT_EQ(readLine(52).alarms, kDS1AlarmRemote);
}

TEST_F(LineCommandsTest, AlarmsAddUp) {
    succeed(R"({"command": "line-alarm", "line": 52, "alarm": "lof"})");
    EXPECT_EQ(readLine(52).alarms, kDS1AlarmRemote | kDS1AlarmLossOfFrame | kDS1AlarmSendingRemote);
}

TEST_F(LineCommandsTest, MendedLineHasNeitherAlarmsNorRates) {
    succeed(R"({"command": "line-alarm", "line": 52, "alarm": "ais"})");
    journal.take();
    clock.advance(4s);
    succeed(R"({"command": "line-mend", "line": 52})");
    clock.advance(4s);
    DS1LineCounters const counters = readLine(52);
    EXPECT_EQ(counters.alarms, 0U);
    EXPECT_EQ(counters.controlledSlips, 2U);
    EXPECT_EQ(counters.outOfFrameSeconds, 4U);
    EXPECT_THAT(journal.take(),
                ElementsAre("30002 board 5 value 0102", "30002 board 5 value 0103"));
    succeed(R"({"command": "line-mend", "line": 52})");
    EXPECT_THAT(journal.take(), IsEmpty());
}

TEST_F(LineCommandsTest, ListTellsEverythingOfEveryLine) {
    succeed(R"({"command": "line-errors", "line": 52, "errors": {"path-violations": 7}})");
    clock.advance(2s);
    json const lines = run(R"({"command": "line-list"})")["lines"];
    ASSERT_EQ(lines.size(), 2U);
    EXPECT_EQ(lines[0]["name"], "first");
    EXPECT_EQ(lines[1], json::parse(R"({
        "line": 52, "name": null, "board": 5, "board-name": "trunks", "type": 5, "seconds": 62,
        "errors": {"code-violations": 0, "path-violations": 7, "framing-errors": 0, "slips": 1},
        "los-seconds": 0, "out-of-frame-seconds": 0, "ais-seconds": 0, "alarms": ["rai"],
        "rates": {"code-violations": 0, "path-violations": 0, "framing-errors": 0, "slips": 0.5},
        "past-seconds": 60})"));
}

TEST_F(LineCommandsTest, ShownBoardCanBeInsertedAgainWithItsLines) {
    succeed(R"({"command": "line-alarm", "line": 51, "alarm": "los"})");
    succeed(R"({"command": "line-rates", "line": 51, "rates": {"framing-errors": 0.125}})");
    json const shown = run(R"({"command": "show", "board": 5})")["boards"][0];
    succeed(R"({"command": "remove", "board": 5})");
    json const reply = kvlsim::execute({{"command", "insert"}, {"board", shown}});
    ASSERT_EQ(reply["ok"], true) << reply;
    EXPECT_EQ(run(R"({"command": "show", "board": 5})")["boards"][0], shown);
    clock.advance(8s);
    EXPECT_EQ(readLine(51).framingErrors, 1U);
    EXPECT_EQ(readLine(51).lossOfSignalSeconds, 8U);
}

TEST_F(LineCommandsTest, ShownBoardCanBeInsertedAgainAfterItsLinesTypeWasSet) {
    succeed(R"({"command": "set", "object": 51, "attribute": "LINE_TYPE", "value": 3})");
    json const shown = run(R"({"command": "show", "board": 5})")["boards"][0];
    EXPECT_EQ(shown["devices"][0]["line"]["type"], "d4");
    succeed(R"({"command": "remove", "board": 5})");
    json const reply = kvlsim::execute({{"command", "insert"}, {"board", shown}});
    EXPECT_EQ(reply["ok"], true) << reply;
}

TEST_F(LineCommandsTest, ValueOfLineTypeIsFreeWhereThereIsNoLine) {
    succeed(R"({"command": "set", "object": 53, "attribute": "LINE_TYPE", "value": 9})");
}

/// A `BadCommand` is a command that is refused, with the error.
struct BadCommand {
    char const* name;
    char const* command;
    char const* error;
};

class BadLineCommandTest : public LineCommandsTest,
                           public testing::WithParamInterface<BadCommand> {};

TEST_P(BadLineCommandTest, IsRefusedAndChangesNothing) {
    json const before = run(R"({"command": "line-list"})");
    json const reply = run(GetParam().command);
    EXPECT_EQ(reply["ok"], false);
    EXPECT_EQ(reply["error"], GetParam().error);
    EXPECT_EQ(run(R"({"command": "line-list"})"), before);
    EXPECT_THAT(journal.take(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Commands, BadLineCommandTest,
    testing::Values(
        BadCommand{"NoLine", R"({"command": "line-mend"})",
                   "argument \"line\" is missing; give it"},
        BadCommand{"UnknownObject", R"({"command": "line-mend", "line": 99})",
                   "no object 99 in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{"DeviceWithoutLine", R"({"command": "line-mend", "line": "voice"})",
                   "device 53 has no line; \"kvlsim line list\" lists those that have"},
        BadCommand{"Board", R"({"command": "line-mend", "line": "S5"})",
                   "board 5 has no line; \"kvlsim line list\" lists those that have"},
        BadCommand{"NoErrors", R"({"command": "line-errors", "line": 51, "errors": {}})",
                   "\"errors\" is empty; write for example {\"code-violations\": 5}"},
        BadCommand{"ErrorsAreANumber", R"({"command": "line-errors", "line": 51, "errors": 5})",
                   "errors cannot be 5; write one kind a line, such as slips: 2"},
        BadCommand{"UnknownError",
                   R"({"command": "line-errors", "line": 51, "errors": {"crc": 5}})",
                   "no error of a line is called \"crc\"; there are code-violations, "
                   "path-violations, framing-errors, slips"},
        BadCommand{"HalfAnError",
                   R"({"command": "line-errors", "line": 51, "errors": {"slips": 0.5}})",
                   "slips cannot be 0.5; write a number from 0 to 4294967295"},
        BadCommand{"TooManyErrors",
                   R"({"command": "line-errors", "line": 51, "errors": {"slips": 4294967296}})",
                   "slips cannot be 4294967296; write a number from 0 to 4294967295"},
        BadCommand{"NoRates", R"({"command": "line-rates", "line": 51, "rates": {}})",
                   "\"rates\" is empty; write for example {\"code-violations\": 5}"},
        BadCommand{"NegativeRate",
                   R"({"command": "line-rates", "line": 51,
                       "rates": {"code-violations": 3, "slips": -1}})",
                   "the rate of slips cannot be -1; write a number per second from 0 to 1000000, "
                   "such as 0.5"},
        BadCommand{"UnknownAlarm", R"({"command": "line-alarm", "line": 51, "alarm": "blue"})",
                   "no alarm is called \"blue\"; there are los, lof, ais, rai, sending-rai, "
                   "sending-ais, loopback, ts16-ais, remote-multiframe, "
                   "sending-remote-multiframe, test-code"},
        BadCommand{"AlarmIsANumber", R"({"command": "line-alarm", "line": 51, "alarm": 1})",
                   "\"alarm\" cannot be 1; write a text"},
        BadCommand{"ClearIsAText",
                   R"({"command": "line-alarm", "line": 51, "alarm": "los", "clear": "yes"})",
                   "\"clear\" cannot be \"yes\"; write true or false"},
        BadCommand{"ListOfOne", R"({"command": "line-list", "line": 51})",
                   "unknown argument \"line\"; this command takes none"},
        BadCommand{"SetOfCounters",
                   R"({"command": "set", "object": 51, "attribute": "LINE_COUNTERS", "value": 1})",
                   "LINE_COUNTERS is answered by a line or by ISDN channels; \"line-list\" and "
                   "\"call-list\" show what there is"},
        BadCommand{"SetOfAnUnknownType",
                   R"({"command": "set", "object": 51, "attribute": "LINE_TYPE", "value": 8})",
                   "LINE_TYPE of a line is one of 2 (esf), 3 (d4), 4 (e1), 5 (e1-crc), 6 (e1-mf), "
                   "7 (e1-crc-mf), in 4 bytes"},
        BadCommand{"InsertOfABadLine",
                   R"({"command": "insert", "board": {"handle": 6,
                       "attributes": {"SERIAL_NUMBER": "S6"},
                       "devices": [{"handle": 61, "type": 501, "line": {"type": "t1"}}]}})",
                   "the line of device 61 cannot be of type \"t1\"; choose one of esf, d4, e1, "
                   "e1-crc, e1-mf, e1-crc-mf"}),
    [](auto const& command) { return command.param.name; });

} // namespace
