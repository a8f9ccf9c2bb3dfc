// SPDX-License-Identifier: BSD-2-Clause
// The control commands for calls: what each changes, announces and refuses.
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/simulator/EventJournal.h"

namespace {

using nlohmann::json;
using support::EventJournal;
using testing::ElementsAre;
using testing::IsEmpty;

class CallCommandsTest : public testing::Test {
  protected:
    CallCommandsTest() {
        kvlsim::loadChassis(R"(
boards:
  - handle: 3
    attributes: {SERIAL_NUMBER: "S3"}
    devices:
      - {handle: 31, type: 514, attributes: {NAME: primary}, channels: {bearers: 3}}
      - {handle: 32, type: 514, channels: {bearers: 1, signalling: inactive}}
      - {handle: 33, type: 503}
)");
    }

    static json run(std::string const& command) { return kvlsim::execute(json::parse(command)); }
    static json succeed(std::string const& command) {
        json const reply = run(command);
        EXPECT_EQ(reply["ok"], true) << command << " -> " << reply;
        return reply;
    }
    static json trunks() { return run(R"({"command": "call-list"})")["trunks"]; }

    EventJournal journal;
};

TEST_F(CallCommandsTest, ListTellsEveryChannelOfEveryTrunk) {
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 2})");
    EXPECT_EQ(trunks(), json::parse(R"([
        {"trunk": 31, "name": "primary", "board": 3, "signalling": "l2",
         "channels": ["idle", "active", "idle"]},
        {"trunk": 32, "name": null, "board": 3, "signalling": "inactive",
         "channels": ["idle"]}])"));
}

TEST_F(CallCommandsTest, CallGoesThroughAllStatesAndAnnouncesEach) {
    EXPECT_EQ(succeed(R"({"command": "call-setup", "trunk": "primary", "channel": 2})")["channel"],
              2);
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 31 channel 2 is 2",
                                            "50001 board 3 device 31 channel 2 is 3",
                                            "50001 board 3 device 31 channel 2 is 4"));
}

TEST_F(CallCommandsTest, CallStopsAtTheStateThatIsNamed) {
    succeed(R"({"command": "call-setup", "trunk": 31, "state": "connected"})");
    EXPECT_EQ(trunks()[0]["channels"], json::parse(R"(["connected", "idle", "idle"])"));
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 31 channel 1 is 2",
                                            "50001 board 3 device 31 channel 1 is 3"));
}

TEST_F(CallCommandsTest, CallWithoutChannelTakesTheFirstIdleOne) {
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 1})");
    EXPECT_EQ(succeed(R"({"command": "call-setup", "trunk": 31})")["channel"], 2);
    succeed(R"({"command": "call-release", "trunk": 31, "channel": 1})");
    EXPECT_EQ(succeed(R"({"command": "call-setup", "trunk": 31})")["channel"], 1);
}

TEST_F(CallCommandsTest, ReleasedChannelIsIdle) {
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 3})");
    journal.take();
    succeed(R"({"command": "call-release", "trunk": 31, "channel": 3})");
    EXPECT_EQ(trunks()[0]["channels"], json::parse(R"(["idle", "idle", "idle"])"));
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 31 channel 3 is 1"));
}

TEST_F(CallCommandsTest, ReleaseOfAllAnnouncesThoseThatWereThere) {
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 1, "state": "connecting"})");
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 3})");
    journal.take();
    EXPECT_EQ(succeed(R"({"command": "call-release", "trunk": 31, "all": true})")["released"], 2);
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 31 channel 1 is 1",
                                            "50001 board 3 device 31 channel 3 is 1"));
    EXPECT_EQ(succeed(R"({"command": "call-release", "trunk": 31, "all": true})")["released"], 0);
    EXPECT_THAT(journal.take(), IsEmpty());
}

TEST_F(CallCommandsTest, SignallingIsAnnouncedWhenItChanges) {
    succeed(R"({"command": "call-signalling", "trunk": 31, "state": "l1"})");
    succeed(R"({"command": "call-signalling", "trunk": 31, "state": "l1"})");
    succeed(R"({"command": "call-signalling", "trunk": 31, "state": "inactive"})");
    EXPECT_EQ(trunks()[0]["signalling"], "inactive");
    EXPECT_THAT(journal.take(), ElementsAre("50002 board 3 device 31 channel 0 is 2",
                                            "50002 board 3 device 31 channel 0 is 1"));
}

TEST_F(CallCommandsTest, ChargeIsAnnouncedWithTheStateAsItIs) {
    succeed(R"({"command": "call-setup", "trunk": 31, "channel": 2, "state": "connected"})");
    journal.take();
    succeed(R"({"command": "call-charge", "trunk": 31, "channel": 2, "units": 3})");
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 31 channel 2 is 3"));
}

TEST_F(CallCommandsTest, ChannelEventsKeepTheirOrderAmongTheOthers) {
    succeed(R"({"command": "call-signalling", "trunk": 32, "state": "l2"})");
    succeed(R"({"command": "insert", "board": {"handle": 4,
                "attributes": {"SERIAL_NUMBER": "S4"}}})");
    succeed(R"({"command": "call-setup", "trunk": 32, "state": "connecting"})");
    succeed(R"({"command": "remove", "board": 4})");
    EXPECT_THAT(journal.take(),
                ElementsAre("50002 board 3 device 32 channel 0 is 3", "40007 board 4",
                            "50001 board 3 device 32 channel 1 is 2", "40005 board 4"));
}

TEST_F(CallCommandsTest, RawEventOfAChannelNamesItsBoardOnly) {
    succeed(R"({"command": "event", "id": "0x50001", "board": 3})");
    EXPECT_THAT(journal.take(), ElementsAre("50001 board 3 device 0 channel 0 is 0"));
}

TEST_F(CallCommandsTest, ShownBoardCanBeInsertedAgainWithItsChannelsIdle) {
    succeed(R"({"command": "call-setup", "trunk": 31})");
    succeed(R"({"command": "call-signalling", "trunk": 31, "state": "l1"})");
    json const shown = run(R"({"command": "show", "board": 3})")["boards"][0];
    succeed(R"({"command": "remove", "board": 3})");
    EXPECT_EQ(trunks(), json::array());
    json const reply = kvlsim::execute({{"command", "insert"}, {"board", shown}});
    ASSERT_EQ(reply["ok"], true) << reply;
    EXPECT_EQ(trunks()[0]["signalling"], "l1");
    EXPECT_EQ(trunks()[0]["channels"], json::parse(R"(["idle", "idle", "idle"])"));
}

/// A `BadCommand` is a command that is refused, with the error.
struct BadCommand {
    char const* name;
    char const* command;
    char const* error;
};

class BadCallCommandTest : public CallCommandsTest,
                           public testing::WithParamInterface<BadCommand> {};

TEST_P(BadCallCommandTest, IsRefusedAndChangesNothing) {
    succeed(R"({"command": "call-setup", "trunk": 32, "state": "connecting"})");
    json const before = trunks();
    journal.take();
    json const reply = run(GetParam().command);
    EXPECT_EQ(reply["ok"], false);
    EXPECT_EQ(reply["error"], GetParam().error);
    EXPECT_EQ(trunks(), before);
    EXPECT_THAT(journal.take(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Commands, BadCallCommandTest,
    testing::Values(
        BadCommand{"NoTrunk", R"({"command": "call-setup"})",
                   "argument \"trunk\" is missing; give it"},
        BadCommand{"DeviceWithoutChannels", R"({"command": "call-setup", "trunk": 33})",
                   "device 33 has no channels; \"kvlsim call list\" lists those that have"},
        BadCommand{"ChannelInUse", R"({"command": "call-setup", "trunk": 32, "channel": 1})",
                   "channel 1 of trunk 32 is connecting; release it first"},
        BadCommand{"NoIdleChannel", R"({"command": "call-setup", "trunk": 32})",
                   "trunk 32 has no idle channel; release one"},
        BadCommand{"ChannelZero", R"({"command": "call-setup", "trunk": 31, "channel": 0})",
                   "\"channel\" cannot be 0; write a whole number from 1 to 3"},
        BadCommand{"ChannelBeyondTheLast",
                   R"({"command": "call-setup", "trunk": 31, "channel": 4})",
                   "\"channel\" cannot be 4; write a whole number from 1 to 3"},
        BadCommand{"SetupToIdle", R"({"command": "call-setup", "trunk": 31, "state": "idle"})",
                   "a call cannot be set up to \"idle\"; choose connecting, connected or active"},
        BadCommand{"ReleaseOfNothing", R"({"command": "call-release", "trunk": 31})",
                   "give either \"channel\" or \"all\": true"},
        BadCommand{"ReleaseOfOneAndAll",
                   R"({"command": "call-release", "trunk": 31, "channel": 1, "all": true})",
                   "give either \"channel\" or \"all\": true"},
        BadCommand{"ReleaseOfAnIdleChannel",
                   R"({"command": "call-release", "trunk": 31, "channel": 1})",
                   "channel 1 of trunk 31 is idle; there is no call to release"},
        BadCommand{"UnknownInformation",
                   R"({"command": "call-setup", "trunk": 31, "information": "smoke"})",
                   "a call cannot carry \"smoke\"; choose one of unknown, speech, digital, "
                   "digital-56, restricted-digital, audio-31, audio-7, video, packet-switched"},
        BadCommand{"PeerThatIsTooLong",
                   R"({"command": "call-setup", "trunk": 31,
                       "peer": "12345678901234567890123456789012"})",
                   "peer \"12345678901234567890123456789012\" is too long; 31 bytes are the most"},
        BadCommand{"ChargeOfAnIdleChannel",
                   R"({"command": "call-charge", "trunk": 31, "channel": 1, "units": 1})",
                   "channel 1 of trunk 31 is idle; there is no call to charge"},
        BadCommand{"ChargeOfNothing",
                   R"({"command": "call-charge", "trunk": 32, "channel": 1, "units": 0})",
                   "\"units\" cannot be 0; write a whole number from 1 to 1000000000"},
        BadCommand{"UnknownSignalling",
                   R"({"command": "call-signalling", "trunk": 31, "state": "l3"})",
                   "signalling cannot be the text \"l3\"; choose inactive, l1 or l2"},
        BadCommand{"SignallingIsANumber",
                   R"({"command": "call-signalling", "trunk": 31, "state": 1})",
                   "\"state\" cannot be 1; write a text"},
        BadCommand{"RawEventWithoutBoard", R"({"command": "event", "id": "0x50001"})",
                   "this event concerns one board; name it in \"board\""}),
    [](auto const& command) { return command.param.name; });

} // namespace
