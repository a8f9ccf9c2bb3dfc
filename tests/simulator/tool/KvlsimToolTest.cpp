// SPDX-License-Identifier: BSD-2-Clause
// kvlsim, end to end: the real tool against a real process that holds a platform.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using nlohmann::json;
using support::ChildProcess;
using support::Finished;
using testing::HasSubstr;
using testing::StartsWith;

class KvlsimToolTest : public ToolTest {
  protected:
    json board(std::string const& name) const {
        Finished const shown = kvlsim({"show", name, "--json"});
        EXPECT_EQ(shown.status, 0) << shown.err;
        return json::parse(shown.out)["boards"][0];
    }
};

TEST_F(KvlsimToolTest, PulledBoardIsAnnouncedAndGone) {
    ChildProcess& process = hold();
    succeed({"remove", "2"});
    EXPECT_EQ(process.readLine(), "event 40005 2");
    Finished const table = kvlsim({"show"});
    EXPECT_THAT(table.out, HasSubstr("NX5-T1"));
    EXPECT_THAT(table.out, testing::Not(HasSubstr("QUILLON")));
}

TEST_F(KvlsimToolTest, ChangingCommandHasDeliveredItsEventsWhenItReturns) {
    ChildProcess& process = hold();
    succeed({"stop", "1", "VORN-E1"});
    process.writeLine("read 1 NAME");
    for (char const* line :
         {"event 4000A 1", "event 40008 1", "event 4000A 3", "event 40008 3", "value NX5-T1"})
        EXPECT_EQ(process.readLine(), line);
}

TEST_F(KvlsimToolTest, OneWordInsertsABoard) {
    ChildProcess& process = hold();
    Finished const inserted = kvlsim({"insert"});
    EXPECT_EQ(inserted.out, "board 4, serial number SIM4\n");
    EXPECT_EQ(process.readLine(), "event 40007 4");
    process.writeLine("read 4 SERIAL_NUMBER");
    EXPECT_EQ(process.readLine(), "value SIM4");
}

TEST_F(KvlsimToolTest, InsertTakesOptions) {
    hold();
    succeed({"insert", "--handle", "0x20", "--serial", "12345", "--name", "MINE", "--family", "Z7",
             "--platform", "VORN", "--devices", "2", "--attribute", "IRQ=9", "--attribute",
             "FIRMWARE_VERSION=7"});
    json const inserted = board("MINE");
    EXPECT_EQ(inserted["handle"], 32);
    EXPECT_EQ(inserted["attributes"]["SERIAL_NUMBER"], "12345");
    EXPECT_EQ(inserted["attributes"]["FAMILY"], "Z7");
    EXPECT_EQ(inserted["attributes"]["CTPLATFORM"], "VORN");
    EXPECT_EQ(inserted["attributes"]["IRQ"], 9);
    EXPECT_EQ(inserted["attributes"]["FIRMWARE_VERSION"], "7");
    EXPECT_EQ(inserted["devices"].size(), 2U);
}

TEST_F(KvlsimToolTest, InsertTakesAFileInYaml) {
    hold();
    succeed({"insert", write("board.yaml", "handle: 50\n"
                                           "attributes:\n"
                                           "  SERIAL_NUMBER: \"FILE\"\n"
                                           "  LOGICAL ID: {short: 5}\n")});
    EXPECT_EQ(board("FILE")["attributes"]["LOGICAL ID"], json::parse(R"({"short": 5})"));
}

TEST_F(KvlsimToolTest, InsertTakesWhatShowPrintsAsJson) {
    hold();
    json const shown = board("3");
    succeed({"remove", "3"});
    succeed({"insert", write("board.json", shown.dump(1, '\t'))});
    EXPECT_EQ(board("3"), shown);
}

TEST_F(KvlsimToolTest, InsertTakesAllBoardsThatShowPrintsAsJson) {
    hold();
    std::string const shown = succeed({"show", "--json"});
    succeed({"remove", "1", "2", "3"});
    succeed({"insert", write("boards.json", shown)});
    EXPECT_EQ(json::parse(succeed({"show", "--json"}))["boards"], json::parse(shown)["boards"]);
}

TEST_F(KvlsimToolTest, InsertTakesABigBoardThatShowPrintsAsJson) {
    std::string const path = directory.file("big.yaml");
    succeed({"generate", "--boards", "1", "--devices", "300", "--lines", "300", "--subdevices", "4",
             "--output", path});
    hold({"KVLSIM_CHASSIS=" + path});
    json const shown = board("1");
    std::string const text = shown.dump();
    EXPECT_GT(text.size(), 200000U);
    succeed({"remove", "1"});
    succeed({"insert", write("board.json", text)});
    EXPECT_EQ(board("1"), shown);
}

TEST_F(KvlsimToolTest, InsertOfAFileWithSeveralErrorsNamesAllAndInsertsNothing) {
    hold();
    for (char const* const text :
         {"boards:\n  - handle: 91\n  - {handle: 92, attributes: {SERIAL_NUMBER: B92}}\n"
          "  - {handle: many, attributes: {SERIAL_NUMBER: B93}}\n",
          "handle: many\nattributes: {IRQ: [1]}\n"}) {
        std::string const file = write("bad.yaml", text);
        Finished const result = kvlsim({"insert", file});
        EXPECT_EQ(result.status, 1);
        std::istringstream lines(result.err);
        int faults = 0;
        for (std::string line; std::getline(lines, line); ++faults)
            EXPECT_THAT(line, StartsWith("kvlsim: " + file + ":"));
        EXPECT_GE(faults, 2) << result.err;
    }
    EXPECT_EQ(kvlsim({"show", "92"}).status, 1);
}

TEST_F(KvlsimToolTest, InsertOfABadFileNamesTheLine) {
    hold();
    std::string const path = write("bad.yaml", "handle: 50\nattributes: {NAME: X}\n");
    expectRefusalLine({"insert", path}, 1,
                      "kvlsim: " + path +
                          ":1: board 50 has no SERIAL_NUMBER; give it one under attributes");
}

TEST_F(KvlsimToolTest, ReplacedBoardKeepsItsHandle) {
    ChildProcess& process = hold();
    succeed({"replace", "1", "--serial", "0815", "--attribute", "IRQ=0x5"});
    EXPECT_EQ(process.readLine(), "event 40007 1");
    EXPECT_EQ(board("1")["attributes"]["SERIAL_NUMBER"], "0815");
    EXPECT_EQ(board("1")["attributes"]["IRQ"], 5);
}

TEST_F(KvlsimToolTest, BoardFailsAndStartsAgain) {
    ChildProcess& process = hold();
    succeed({"fail", "1"});
    EXPECT_THAT(kvlsim({"show"}).out, HasSubstr("failed"));
    succeed({"start", "1"});
    for (char const* line : {"event 40006 1", "event 40009 1", "event 40007 1"})
        EXPECT_EQ(process.readLine(), line);
}

TEST_F(KvlsimToolTest, FaultsAndRawEventsArrive) {
    ChildProcess& process = hold();
    succeed({"fault", "1", "0x10"});
    succeed({"fault", "1", "0x10", "--clear"});
    succeed({"event", "0x40003"});
    succeed({"event", "0x40006", "--board", "4711"});
    for (char const* line : {"event 30001 1", "event 30002 1", "event 40003 0", "event 40006 4711"})
        EXPECT_EQ(process.readLine(), line);
}

TEST_F(KvlsimToolTest, SetWritesValuesInEveryForm) {
    hold();
    succeed({"set", "1", "IRQ", "-1"});
    succeed({"set", "1", "NAME", "42"});
    succeed({"set", "1", "LOGICAL ID", "7", "--short"});
    succeed({"set", "1", "MEMBASEADDR", "--empty"});
    succeed({"set", "1", "LINEADMINADDR", "1,2,3,0xFFFF"});
    succeed({"set", "1", "FREE", "5", "--text"});
    json const attributes = board("1")["attributes"];
    EXPECT_EQ(attributes["IRQ"], -1);
    EXPECT_EQ(attributes["NAME"], "42");
    EXPECT_EQ(attributes["LOGICAL ID"], json::parse(R"({"short": 7})"));
    EXPECT_EQ(attributes["MEMBASEADDR"], json::parse(R"({"empty": true})"));
    EXPECT_EQ(attributes["LINEADMINADDR"], json::parse(R"({"descriptor": [1, 2, 3, 65535]})"));
    EXPECT_EQ(attributes["FREE"], "5");
}

TEST_F(KvlsimToolTest, UnsetTakesAnAttributeFromTheReaders) {
    ChildProcess& process = hold();
    succeed({"unset", "1", "FAMILY"});
    process.writeLine("read 1 FAMILY");
    EXPECT_EQ(process.readLine(), "result 202");
}

TEST_F(KvlsimToolTest, ShowOfOneBoardListsItsDevices) {
    hold();
    std::string const text = kvlsim({"show", "NX5-T1"}).out;
    for (char const* part : {"board 1, started", "SERIAL_NUMBER           NX50001",
                             "device 101, type 501", "sub-device 111, type 502", "processor 191"})
        EXPECT_THAT(text, HasSubstr(part));
}

TEST_F(KvlsimToolTest, RefusalOfThePlatformIsPassedOn) {
    hold();
    expectRefusalLine(
        {"stop", "77"}, 1,
        "kvlsim: no board \"77\" in the chassis; \"kvlsim show\" lists what is there");
}

TEST_F(KvlsimToolTest, MisspeltCommandIsToldWhatWasMeant) {
    expectRefusalLine(
        {"stpo", "1"}, 2,
        "kvlsim: there is no command \"stpo\"; did you mean \"stop\"? kvlsim --help lists "
        "the commands");
    expectRefusalLine(
        {"--socket", "/x", "line", "alrm", "101", "los"}, 2,
        "kvlsim: there is no command \"line alrm\"; did you mean \"line alarm\"? kvlsim "
        "--help lists the commands");
    expectRefusalLine({"frobnicate"}, 2,
                      "kvlsim: there is no command \"frobnicate\"; kvlsim --help explains");
}

TEST_F(KvlsimToolTest, OneWrongBoardAmongSeveralChangesNothing) {
    ChildProcess& process = hold();
    expectRefusalLine(
        {"remove", "1", "NONE"}, 1,
        "kvlsim: no board \"NONE\" in the chassis; \"kvlsim show\" lists what is there");
    expectRefusalLine({"stop", "1", "NX5-T1"}, 1,
                      "kvlsim: board 1 is named twice; nothing is done");
    process.writeLine("read 1 NAME");
    EXPECT_EQ(process.readLine(), "value NX5-T1"); // no event came before
}

TEST_F(KvlsimToolTest, ShowOfADeviceSaysWhoseItIs) {
    hold();
    expectRefusalLine({"show", "101"}, 1,
                      "kvlsim: 101 is a device of board 1, not a board; name board 1");
    expectRefusalLine({"show", "111"}, 1,
                      "kvlsim: 111 is a sub-device of board 1, not a board; name board 1");
}

TEST_F(KvlsimToolTest, ShowOfOneBoardIsReadable) {
    hold(
        {"KVLSIM_CHASSIS=" +
         write(
             "chassis.yaml",
             "boards:\n"
             "  - handle: 1\n"
             "    attributes: {SERIAL_NUMBER: \"A1\", LOGICAL ID: {short: 7}, IRQ: {empty: true}}\n"
             "    devices:\n"
             "      - handle: 2\n"
             "        type: 501\n"
             "        attributes: {TSCADDR: {descriptor: [1, 2, 3, 4]}}\n"
             "        line: {type: e1-crc, alarms: [rai, los], errors: {slips: 0.5}}\n"
             "        channels: {bearers: 3}\n")});
    std::string const text = kvlsim({"show", "1"}).out;
    for (char const* part :
         {"LOGICAL ID              7 (2 bytes)\n", "IRQ                     (no bytes)\n",
          "TSCADDR                 1, 2, 3, 4\n",
          "line: e1-crc, alarms los, rai, errors per second slips 0.5\n",
          "channels: 3 bearers, signalling l2\n"})
        EXPECT_THAT(text, HasSubstr(part));
}

TEST_F(KvlsimToolTest, WithoutASocketItSaysHowToNameOne) {
    Finished const finished = support::run({KVLSIM_TOOL, "show"});
    EXPECT_EQ(finished.status, 1);
    EXPECT_EQ(finished.err, "kvlsim: no platform named; give --socket PATH or set KVLSIM_SOCKET\n");
}

TEST_F(KvlsimToolTest, WithoutAPlatformItSaysHowToStartOne) {
    expectRefusalLine({"show"}, 1,
                      "kvlsim: no simulated platform answers at " + socket() +
                          " (No such file or directory); start one with KVLSIM_SOCKET=" + socket());
}

TEST_F(KvlsimToolTest, SocketIsTakenFromTheOptionFirst) {
    hold();
    expectRefusalLine({"--socket", "/nowhere", "show"}, 1,
                      "kvlsim: no simulated platform answers at /nowhere (No such file or "
                      "directory); start one with KVLSIM_SOCKET=/nowhere");
}

TEST_F(KvlsimToolTest, WrongUseHasStatus2) {
    EXPECT_EQ(kvlsim({}).status, 2);
    EXPECT_EQ(kvlsim({"explode"}).status, 2);
    EXPECT_EQ(kvlsim({"stop"}).status, 2);
    EXPECT_EQ(kvlsim({"generate", "--boards", "many"}).status, 2);
    EXPECT_EQ(kvlsim({"set", "1", "IRQ", "5", "--byte", "--short"}).status, 2);
}

TEST_F(KvlsimToolTest, HelpAndVersionSucceed) {
    EXPECT_THAT(kvlsim({"--help"}).out, HasSubstr("insert"));
    EXPECT_EQ(kvlsim({"insert", "--help"}).status, 0);
    Finished const version = kvlsim({"--version"});
    EXPECT_EQ(version.status, 0);
    EXPECT_THAT(version.out, StartsWith("kvlsim "));
}

} // namespace
