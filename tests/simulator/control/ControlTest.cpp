// SPDX-License-Identifier: BSD-2-Clause
// The control commands: what each changes, announces and refuses.
#include "simulator/exports/Control.h"

#include <cstring>
#include <mutex>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "boardplatform/vqx_event_service.h"

namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

/// A `Journal` is a consumer that records every administrative and fault event as "id board".
class Journal final : public VqxEventService::CEventHandlerAdaptor {
  public:
    Journal() {
        std::vector<VqxEventService::AdminConsumer::FilterCallbackAssoc> filters;
        for (std::uint32_t id = 0x40001; id <= 0x4000A; ++id)
            filters.push_back({this, nullptr, id, 1});
        for (std::uint32_t id = 0x30001; id <= 0x30002; ++id)
            filters.push_back({this, nullptr, id, 1});
        int const count = static_cast<int>(filters.size());
        m_admin = std::make_unique<VqxEventService::VqxAdminConsumer>(
            "ADMIN", L"Journal", filters.data(), count, nullptr, 0);
        m_fault = std::make_unique<VqxEventService::VqxAdminConsumer>(
            "FAULT", L"Journal", filters.data(), count, nullptr, 0);
        m_admin->Start();
        m_fault->Start();
    }

    int HandleEvent(AdminCallbackMsg* message, void*) override {
        std::array<char, 40> line{};
        std::int32_t board = 0;
        if (message->payload != nullptr) std::memcpy(&board, message->payload, sizeof board);
        std::snprintf(line.data(), line.size(), "%X", message->id);
        std::string entry = line.data();
        if (message->payload != nullptr) entry.append(" ").append(std::to_string(board));
        m_lines.push_back(entry);
        return 1;
    }

    /// The events since the last call.
    std::vector<std::string> take() {
        EXPECT_EQ(kvlsim::execute({{"command", "drain"}})["ok"], true);
        return std::exchange(m_lines, {}); // the drain orders this after the handler's calls
    }

  private:
    std::vector<std::string> m_lines;
    std::unique_ptr<VqxEventService::VqxAdminConsumer> m_admin;
    std::unique_ptr<VqxEventService::VqxAdminConsumer> m_fault;
};

class ControlTest : public testing::Test {
  protected:
    ControlTest() {
        kvlsim::loadChassis(R"(
boards:
  - handle: 5
    attributes: {SERIAL_NUMBER: "S5", NAME: first, STATE_CHANGE_DATE: long ago}
    devices:
      - {handle: 51, type: 501, attributes: {NAME: line}, subdevices: [{handle: 52, type: 502}]}
  - handle: 6
    attributes: {SERIAL_NUMBER: "S6", NAME: twin}
  - handle: 7
    attributes: {SERIAL_NUMBER: "S7", NAME: twin}
)");
    }

    static json run(std::string const& command) { return kvlsim::execute(json::parse(command)); }

    static void succeed(std::string const& command) {
        json const reply = run(command);
        EXPECT_EQ(reply["ok"], true) << command << " -> " << reply;
    }

    static std::string refusal(std::string const& command) {
        json const reply = run(command);
        EXPECT_EQ(reply["ok"], false) << command << " -> " << reply;
        return reply.value("error", "");
    }

    static json board(int handle) {
        json const reply = kvlsim::execute({{"command", "show"}, {"board", handle}});
        return reply["ok"] == true ? reply["boards"][0] : json();
    }

    static json attribute(int handle, char const* name) {
        return board(handle)["attributes"].value(name, json());
    }

    static std::vector<int> handles() {
        std::vector<int> list;
        json const reply = run(R"({"command": "show"})");
        for (auto const& each : reply["boards"])
            list.push_back(each["handle"].get<int>());
        return list;
    }

    Journal journal;
};

TEST_F(ControlTest, InsertedBoardIsThereStartedAndAnnouncedAsStarted) {
    succeed(R"({"command": "insert", "board": {"handle": 9, "attributes": {"SERIAL_NUMBER": "S9"},
                "devices": [{"handle": 91, "type": 503}]}})");
    EXPECT_THAT(handles(), ElementsAre(5, 6, 7, 9));
    EXPECT_EQ(attribute(9, "BOARD_CONDITION"), 3);
    EXPECT_EQ(board(9)["devices"][0]["handle"], 91);
    EXPECT_THAT(journal.take(), ElementsAre("40007 9"));
}

TEST_F(ControlTest, RemovedBoardIsGoneWithItsDevices) {
    succeed(R"({"command": "remove", "board": 5})");
    EXPECT_THAT(handles(), ElementsAre(6, 7));
    EXPECT_THAT(refusal(R"({"command": "unset", "object": 51, "attribute": "NAME"})"),
                HasSubstr("no object 51"));
    EXPECT_THAT(journal.take(), ElementsAre("40005 5"));
}

TEST_F(ControlTest, ReplacedBoardHasTheNewSerialNumberAndRuns) {
    succeed(R"({"command": "fail", "board": 5})");
    journal.take();
    succeed(R"({"command": "replace", "board": 5, "serial": "NEW", "attributes": {"IRQ": 3}})");
    EXPECT_EQ(attribute(5, "SERIAL_NUMBER"), "NEW");
    EXPECT_EQ(attribute(5, "IRQ"), 3);
    EXPECT_EQ(attribute(5, "NAME"), "first");
    EXPECT_EQ(attribute(5, "BOARD_CONDITION"), 3);
    EXPECT_THAT(journal.take(), ElementsAre("40007 5"));
}

TEST_F(ControlTest, StartAnnouncesPendingThenStarted) {
    succeed(R"({"command": "stop", "board": 5})");
    journal.take();
    succeed(R"({"command": "start", "board": 5})");
    EXPECT_EQ(attribute(5, "BOARD_CONDITION"), 3);
    EXPECT_THAT(journal.take(), ElementsAre("40009 5", "40007 5"));
}

TEST_F(ControlTest, StopAnnouncesPendingThenStopped) {
    succeed(R"({"command": "stop", "board": 5})");
    EXPECT_EQ(attribute(5, "BOARD_CONDITION"), 4);
    EXPECT_THAT(journal.take(), ElementsAre("4000A 5", "40008 5"));
}

TEST_F(ControlTest, FailedBoardIsInCondition15) {
    succeed(R"({"command": "fail", "board": 5})");
    EXPECT_EQ(attribute(5, "BOARD_CONDITION"), 15);
    EXPECT_THAT(journal.take(), ElementsAre("40006 5"));
}

TEST_F(ControlTest, FaultIsRaisedAndCleared) {
    succeed(R"({"command": "fault", "board": 5, "value": 12})");
    succeed(R"({"command": "fault", "board": 5, "value": 12, "cleared": true})");
    EXPECT_THAT(journal.take(), ElementsAre("30001 5", "30002 5"));
}

TEST_F(ControlTest, StateChangeDateFollowsAChangeOfCondition) {
    EXPECT_EQ(attribute(5, "STATE_CHANGE_DATE"), "long ago");
    succeed(R"({"command": "start", "board": 5})"); // already in condition 3
    EXPECT_EQ(attribute(5, "STATE_CHANGE_DATE"), "long ago");
    succeed(R"({"command": "stop", "board": 5})");
    EXPECT_NE(attribute(5, "STATE_CHANGE_DATE"), "long ago");
}

TEST_F(ControlTest, StateChangeDateFollowsAConditionThatIsSet) {
    succeed(R"({"command": "set", "object": 5, "attribute": "BOARD_CONDITION", "value": 15})");
    EXPECT_NE(attribute(5, "STATE_CHANGE_DATE"), "long ago");
}

TEST_F(ControlTest, SetAndUnsetAnnounceNothing) {
    succeed(R"({"command": "set", "object": 5, "attribute": "IRQ", "value": 4})");
    succeed(R"({"command": "unset", "object": 5, "attribute": "IRQ"})");
    EXPECT_THAT(journal.take(), IsEmpty());
}

TEST_F(ControlTest, SetTakesEveryFormOfValue) {
    for (char const* value : {R"("text")", "-5", R"({"short": 2})", R"({"byte": -3})",
                              R"({"empty": true})", R"({"descriptor": [1, 2, 3, 4]})"}) {
        succeed(std::string(R"({"command": "set", "object": 52, "attribute": "X", "value": )") +
                value + "}");
        EXPECT_EQ(board(5)["devices"][0]["subdevices"][0]["attributes"]["X"], json::parse(value));
    }
}

TEST_F(ControlTest, UnsetTakesTheAttributeAway) {
    succeed(R"({"command": "unset", "object": 5, "attribute": "SERIAL_NUMBER"})");
    EXPECT_TRUE(attribute(5, "SERIAL_NUMBER").is_null());
}

TEST_F(ControlTest, SerialNumberThatWasUnsetIsFreeForAnotherBoard) {
    succeed(R"({"command": "unset", "object": 5, "attribute": "SERIAL_NUMBER"})");
    succeed(R"({"command": "replace", "board": 6, "serial": "S5"})");
    EXPECT_EQ(run(R"({"command": "show", "board": "S5"})")["boards"][0]["handle"], 6);
}

TEST_F(ControlTest, ObjectsAreNamedByHandleSerialNumberOrUniqueName) {
    for (char const* name : {"5", R"("5")", R"("0x5")", R"("S5")", R"("first")"})
        EXPECT_EQ(run(std::string(R"({"command": "show", "board": )") + name +
                      "}")["boards"][0]["handle"],
                  5)
            << name;
    succeed(R"({"command": "set", "object": "line", "attribute": "ChannelCount", "value": 24})");
    EXPECT_EQ(board(5)["devices"][0]["attributes"]["ChannelCount"], 24);
}

TEST_F(ControlTest, NewNameFindsTheBoardAndTheOldOneDoesNot) {
    succeed(R"({"command": "set", "object": 6, "attribute": "NAME", "value": "only"})");
    EXPECT_EQ(run(R"({"command": "show", "board": "only"})")["boards"][0]["handle"], 6);
    EXPECT_EQ(run(R"({"command": "show", "board": "twin"})")["boards"][0]["handle"], 7);
}

TEST_F(ControlTest, EventSendsAnyIdentifierForAnyBoard) {
    succeed(R"({"command": "event", "id": 262145})");
    succeed(R"({"command": "event", "id": "0x40006", "board": 4711})");
    succeed(R"({"command": "event", "id": "0x40006", "board": "S6"})");
    succeed(R"({"command": "event", "id": 262143})");
    EXPECT_THAT(journal.take(), ElementsAre("40001", "40006 4711", "40006 6"));
}

TEST_F(ControlTest, ShowCountsEventsAndConsumers) {
    json const before = run(R"({"command": "show"})")["events"];
    succeed(R"({"command": "event", "id": "0x40001"})");
    journal.take();
    json const after = run(R"({"command": "show"})")["events"];
    EXPECT_EQ(after["announced"], before["announced"].get<int>() + 1);
    EXPECT_EQ(after["delivered"], after["announced"]);
    EXPECT_EQ(after["consumers"], 2);
}

TEST_F(ControlTest, ShownBoardCanBeInsertedAgain) {
    json const shown = board(5);
    succeed(R"({"command": "remove", "board": 5})");
    json const reply = kvlsim::execute({{"command", "insert"}, {"board", shown}});
    EXPECT_EQ(reply["ok"], true) << reply;
    EXPECT_EQ(board(5), shown);
}

TEST_F(ControlTest, VersionAndPingAnswer) {
    EXPECT_FALSE(run(R"({"command": "version"})")["version"].get<std::string>().empty());
    succeed(R"({"command": "ping"})");
}

TEST_F(ControlTest, LoadedChassisIsNotAnnounced) {
    kvlsim::loadChassis("boards: []");
    EXPECT_THAT(handles(), IsEmpty());
    EXPECT_THAT(journal.take(), IsEmpty());
}

TEST_F(ControlTest, BadChassisIsRefusedAndTheOldOneStays) {
    try {
        kvlsim::loadChassis("boards:\n  - handle: x\n");
        FAIL() << "accepted";
    } catch (std::runtime_error const& error) {
        EXPECT_STREQ(error.what(), "chassis:2: the handle of a board cannot be the text \"x\"; "
                                   "write a number from 1 to 2147483646");
    }
    EXPECT_THAT(handles(), ElementsAre(5, 6, 7));
}

/// A `BadCommand` is a command that is refused, with the error.
struct BadCommand {
    char const* name;
    char const* command;
    char const* error;
};

class BadCommandTest : public ControlTest, public testing::WithParamInterface<BadCommand> {};

TEST_P(BadCommandTest, IsRefusedAndChangesNothing) {
    json const before = run(R"({"command": "show"})")["boards"];
    EXPECT_EQ(refusal(GetParam().command), GetParam().error);
    EXPECT_EQ(run(R"({"command": "show"})")["boards"], before);
    EXPECT_THAT(journal.take(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(
    Commands, BadCommandTest,
    testing::Values(
        BadCommand{"NotAnObject", "[1]",
                   "a command is a JSON object, such as {\"command\": \"show\"}"},
        BadCommand{"NoCommand", "{}",
                   "\"command\" is missing or no text; write one such as \"show\""},
        BadCommand{"CommandIsNoText", R"({"command": 5})",
                   "\"command\" is missing or no text; write one such as \"show\""},
        BadCommand{"UnknownCommand", R"({"command": "explode"})",
                   "unknown command \"explode\"; known: insert, remove, replace, start, stop, "
                   "fail, fault, set, unset, event, show, store-list, store-add, store-set, "
                   "store-remove, process-list, process-add, process-end, line-list, line-errors, "
                   "line-rates, line-alarm, line-mend, call-list, call-setup, call-release, "
                   "call-charge, call-signalling, drain, version, ping"},
        BadCommand{"UnknownArgument", R"({"command": "stop", "bord": 5})",
                   "unknown argument \"bord\"; known: board"},
        BadCommand{"ArgumentWhereNoneIsTaken", R"({"command": "drain", "board": 5})",
                   "unknown argument \"board\"; this command takes none"},
        BadCommand{"NoBoard", R"({"command": "stop"})", "argument \"board\" is missing; give it"},
        BadCommand{"UnknownHandle", R"({"command": "stop", "board": 8})",
                   "no board 8 in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{
            "HugeHandle", R"({"command": "stop", "board": 18446744073709551615})",
            "no board 18446744073709551615 in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{"RootAsBoard", R"({"command": "stop", "board": 2147483647})",
                   "no board 2147483647 in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{"DeviceAsBoard", R"({"command": "stop", "board": 51})",
                   "51 is a device of board 5, not a board; name board 5"},
        BadCommand{"UnknownSerialNumber", R"({"command": "stop", "board": "S8"})",
                   "no board \"S8\" in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{"AmbiguousName", R"({"command": "stop", "board": "twin"})",
                   "2 boards are called \"twin\"; write the handle or the serial number"},
        BadCommand{"BoardIsAList", R"({"command": "stop", "board": [5]})",
                   "\"board\" cannot be a list; write a handle, a serial number or a NAME"},
        BadCommand{"BoardIsAFraction", R"({"command": "stop", "board": 5.5})",
                   "\"board\" cannot be 5.5; write a handle, a serial number or a NAME"},
        BadCommand{"InsertWithoutDescription", R"({"command": "insert", "board": 5})",
                   "\"board\" must be a board's description, an object with \"handle\" and "
                   "\"attributes\""},
        BadCommand{"InsertWithTakenHandle",
                   R"({"command": "insert", "board": {"handle": 51,
                       "attributes": {"SERIAL_NUMBER": "S8"}}})",
                   "handle 51 is taken by another device; choose a free one"},
        BadCommand{"InsertWithTakenSerialNumber",
                   R"({"command": "insert", "board": {"handle": 8,
                       "attributes": {"SERIAL_NUMBER": "S6"}}})",
                   "board 8 cannot have SERIAL_NUMBER \"S6\": board 6 has it; serial numbers must "
                   "differ"},
        BadCommand{"InsertWithSharedHandle",
                   R"({"command": "insert", "board": {"handle": 8,
                       "attributes": {"SERIAL_NUMBER": "S8"}, "processors": [{"handle": 8}]}})",
                   "handle 8 is already the board; give every object a handle of its own"},
        BadCommand{"InsertWithFraction",
                   R"({"command": "insert", "board": {"handle": 8,
                       "attributes": {"SERIAL_NUMBER": "S8", "IRQ": 1.5}}})",
                   "IRQ cannot be 1.5; it is a number, write a decimal or 0x number"},
        BadCommand{"InsertTooDeep",
                   R"({"command": "insert", "board": {"handle": 8, "attributes":
                       {"X": [[[[[[[[[[[[[[1]]]]]]]]]]]]]]}}})",
                   "too many nested levels; a chassis needs at most 12"},
        BadCommand{"ReplaceWithoutSerial", R"({"command": "replace", "board": 5})",
                   "argument \"serial\" is missing; give it"},
        BadCommand{"ReplaceWithSameSerial", R"({"command": "replace", "board": 5, "serial": "S5"})",
                   "board 5 already has serial number \"S5\"; a replacement has another"},
        BadCommand{"ReplaceWithTakenSerial",
                   R"({"command": "replace", "board": 5, "serial": "S6"})",
                   "board 5 cannot have SERIAL_NUMBER \"S6\": board 6 has it; serial numbers must "
                   "differ"},
        BadCommand{"ReplaceWithNumber", R"({"command": "replace", "board": 5, "serial": 6})",
                   "\"serial\" cannot be 6; write a text"},
        BadCommand{"ReplaceWithEmptySerial", R"({"command": "replace", "board": 5, "serial": ""})",
                   "\"serial\" is empty; write the new serial number"},
        BadCommand{"ReplaceWithBadAttribute",
                   R"({"command": "replace", "board": 5, "serial": "N",
                       "attributes": {"IRQ": "x"}})",
                   "IRQ cannot be the text \"x\"; it is a number, write a decimal or 0x number"},
        BadCommand{"FaultOutOfRange", R"({"command": "fault", "board": 5, "value": 65536})",
                   "\"value\" cannot be 65536; write a whole number from 0 to 65535"},
        BadCommand{"FaultClearedByNumber",
                   R"({"command": "fault", "board": 5, "value": 1, "cleared": 1})",
                   "\"cleared\" cannot be 1; write true or false"},
        BadCommand{"SetWrongKind",
                   R"({"command": "set", "object": 5, "attribute": "NAME", "value": 5})",
                   "NAME cannot be 5; it is a text, write it in quotes"},
        BadCommand{"SetNothing",
                   R"({"command": "set", "object": 5, "attribute": "NAME", "value": null})",
                   "NAME has no value; write one or remove the attribute"},
        BadCommand{"SetType", R"({"command": "set", "object": 5, "attribute": "TYPE", "value": 5})",
                   "TYPE says what an object is; it cannot be changed"},
        BadCommand{"SetTakenSerial",
                   R"({"command": "set", "object": 5, "attribute": "SERIAL_NUMBER",
                       "value": "S6"})",
                   "board 5 cannot have SERIAL_NUMBER \"S6\": board 6 has it; serial numbers must "
                   "differ"},
        BadCommand{"SetNamelessAttribute",
                   R"({"command": "set", "object": 5, "attribute": "", "value": 5})",
                   "\"\" cannot be an attribute's name; it has 1 to 127 printable characters"},
        BadCommand{"SetTheRoot",
                   R"({"command": "set", "object": 2147483647, "attribute": "A", "value": 5})",
                   "no object 2147483647 in the chassis; \"kvlsim show\" lists what is there"},
        BadCommand{"UnsetMissing", R"({"command": "unset", "object": 5, "attribute": "IRQ"})",
                   "board 5 has no attribute \"IRQ\"; nothing to unset"},
        BadCommand{"EventWithoutId", R"({"command": "event"})",
                   "argument \"id\" is missing; give it"},
        BadCommand{"EventOutOfRange", R"({"command": "event", "id": -1})",
                   "\"id\" cannot be -1; write a whole number from 0 to 4294967295"},
        BadCommand{"BoardEventWithoutBoard", R"({"command": "event", "id": "0x40005"})",
                   "this event concerns one board; name it in \"board\""},
        BadCommand{"EventForUnknownSerial",
                   R"({"command": "event", "id": "0x40005", "board": "S8"})",
                   "no board \"S8\" in the chassis; \"kvlsim show\" lists what is there"}),
    [](auto const& command) { return command.param.name; });

} // namespace
