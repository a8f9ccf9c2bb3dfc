// SPDX-License-Identifier: BSD-2-Clause
// kvlsim, end to end: the real tool against a real process that holds a platform.
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstring>
#include <fstream>
#include <sstream>

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

    void expectRefusal(std::vector<std::string> const& arguments, int status,
                       std::string const& line) const {
        Finished const finished = kvlsim(arguments);
        EXPECT_EQ(finished.status, status);
        EXPECT_EQ(finished.err, line + "\n");
        EXPECT_EQ(finished.out, "");
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

TEST_F(KvlsimToolTest, InsertOfABadFileNamesTheLine) {
    hold();
    std::string const path = write("bad.yaml", "handle: 50\nattributes: {NAME: X}\n");
    expectRefusal({"insert", path}, 1,
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
    expectRefusal({"stop", "77"}, 1,
                  "kvlsim: no board \"77\" in the chassis; \"kvlsim show\" lists what is there");
}

TEST_F(KvlsimToolTest, MisspeltCommandIsToldWhatWasMeant) {
    expectRefusal(
        {"stpo", "1"}, 2,
        "kvlsim: there is no command \"stpo\"; did you mean \"stop\"? kvlsim --help lists "
        "the commands");
    expectRefusal({"--socket", "/x", "line", "alrm", "101", "los"}, 2,
                  "kvlsim: there is no command \"line alrm\"; did you mean \"line alarm\"? kvlsim "
                  "--help lists the commands");
    expectRefusal({"frobnicate"}, 2,
                  "kvlsim: there is no command \"frobnicate\"; kvlsim --help explains");
}

TEST_F(KvlsimToolTest, OneWrongBoardAmongSeveralChangesNothing) {
    ChildProcess& process = hold();
    expectRefusal({"remove", "1", "NONE"}, 1,
                  "kvlsim: no board \"NONE\" in the chassis; \"kvlsim show\" lists what is there");
    expectRefusal({"stop", "1", "NX5-T1"}, 1, "kvlsim: board 1 is named twice; nothing is done");
    process.writeLine("read 1 NAME");
    EXPECT_EQ(process.readLine(), "value NX5-T1"); // no event came before
}

TEST_F(KvlsimToolTest, ShowOfADeviceSaysWhoseItIs) {
    hold();
    expectRefusal({"show", "101"}, 1,
                  "kvlsim: 101 is a device of board 1, not a board; name board 1");
    expectRefusal({"show", "111"}, 1,
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
    expectRefusal({"show"}, 1,
                  "kvlsim: no simulated platform answers at " + socket() +
                      " (No such file or directory); start one with KVLSIM_SOCKET=" + socket());
}

TEST_F(KvlsimToolTest, SocketIsTakenFromTheOptionFirst) {
    hold();
    expectRefusal({"--socket", "/nowhere", "show"}, 1,
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

TEST_F(KvlsimToolTest, GeneratedChassisIsGood) {
    std::string const path = directory.file("big.yaml");
    succeed({"generate", "--boards", "200", "--devices", "3", "--output", path});
    Finished const checked = kvlsim({"check", path});
    EXPECT_EQ(checked.status, 0) << checked.err;
    EXPECT_EQ(checked.out, path + ": good, 200 boards\n");
    EXPECT_EQ(checked.err, "");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    process.writeLine("read 200 SERIAL_NUMBER");
    EXPECT_THAT(process.readLine(), testing::EndsWith("0000200"));
}

TEST_F(KvlsimToolTest, SameSeedMakesTheSameChassisAndAnotherDoesNot) {
    std::string const one = kvlsim({"generate", "--boards", "5", "--seed", "7"}).out;
    EXPECT_FALSE(one.empty());
    EXPECT_EQ(kvlsim({"generate", "--boards", "5", "--seed", "7"}).out, one);
    auto const behindFirstLine = [](std::string const& text) {
        return text.substr(text.find('\n'));
    };
    EXPECT_NE(behindFirstLine(kvlsim({"generate", "--boards", "5", "--seed", "8"}).out),
              behindFirstLine(one));
}

TEST_F(KvlsimToolTest, ChassisThatCannotBeWrittenLeavesNothingBehind) {
    expectRefusal({"generate", "--boards", "1", "--output", directory.file("no/such/place.yaml")},
                  1,
                  "kvlsim: " + directory.file("no/such/place.yaml") +
                      ": cannot be written (No such file or directory); choose a place that is "
                      "writable and has room");
}

TEST_F(KvlsimToolTest, CheckRefusesABadChassisWithItsLine) {
    std::string const path =
        write("bad.yaml", "boards:\n  - {handle: 0, attributes: {SERIAL_NUMBER: A1}}\n");
    expectRefusal({"check", path}, 1,
                  "kvlsim: " + path +
                      ":2: the handle of a board cannot be 0; write a number from 1 to "
                      "2147483646");
}

TEST_F(KvlsimToolTest, CheckReportsEveryErrorAndWarning) {
    std::string const path = write("bad.yaml", "boards:\n"
                                               "  - handle: 0\n"
                                               "    attributes: {SERIAL_NUMBER: A1, FAMILIY: X}\n"
                                               "  - handle: 2\n");
    expectRefusal({"check", path}, 1,
                  "kvlsim: " + path +
                      ":3: warning: unknown attribute \"FAMILIY\"; did you mean FAMILY?\n"
                      "kvlsim: " +
                      path +
                      ":2: the handle of a board cannot be 0; write a number from 1 to "
                      "2147483646\n"
                      "kvlsim: " +
                      path + ":4: board 2 has no SERIAL_NUMBER; give it one under attributes");
}

TEST_F(KvlsimToolTest, CheckOfAMisspeltAttributeWarnsAndSucceeds) {
    std::string const path =
        write("warned.yaml", "boards:\n"
                             "  - handle: 1\n"
                             "    attributes: {SERIAL_NUMBER: A1, BOARD_PRESNT: 0}\n");
    Finished const checked = kvlsim({"check", path});
    EXPECT_EQ(checked.status, 0);
    EXPECT_EQ(checked.out, path + ": good, 1 boards\n");
    EXPECT_EQ(checked.err, "kvlsim: " + path +
                               ":3: warning: unknown attribute \"BOARD_PRESNT\"; did you mean "
                               "BOARD_PRESENT?\n");
}

TEST_F(KvlsimToolTest, BundledChassisIsTheExampleChassis) {
    hold();
    json const bundled = json::parse(kvlsim({"show", "--json"}).out)["boards"];
    hold({"KVLSIM_CHASSIS=" KVLSIM_SMALL_CHASSIS});
    json const example = json::parse(kvlsim({"show", "--json"}).out)["boards"];
    ASSERT_EQ(bundled.size(), 3U);
    for (std::size_t i = 0; i < 3; ++i)
        EXPECT_EQ(bundled[i]["devices"], example[i]["devices"]);
}

TEST_F(KvlsimToolTest, BadChassisIsReportedInOneLineAndThePlatformAnswersNothing) {
    std::string const path = write("bad.yaml", "boards: 5\n");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    std::string const reason = path + ":1: boards cannot be 5; write a list, each board beginning "
                                      "with \"- handle:\"";
    process.writeLine("read 1 NAME");
    EXPECT_EQ(process.readLine(), "result 204");
    expectRefusal({"show"}, 1, "kvlsim: there is no chassis: " + reason);
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0);
    EXPECT_EQ(finished.err, "kvlsim: " + reason + "\n");
}

TEST_F(KvlsimToolTest, LoadingAChassisWarnsOfAMisspeltAttribute) {
    std::string const path = write("warned.yaml", "boards:\n"
                                                  "  - handle: 1\n"
                                                  "    attributes:\n"
                                                  "      SERIAL_NUMBER: A1\n"
                                                  "      FAMILIY: NX5\n");
    ChildProcess& process = hold({"KVLSIM_CHASSIS=" + path});
    process.writeLine("read 1 FAMILIY");
    EXPECT_THAT(process.readLine(), testing::EndsWith("NX5"));
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0);
    EXPECT_EQ(finished.err, "kvlsim: " + path +
                                ":5: warning: unknown attribute \"FAMILIY\"; did you mean "
                                "FAMILY?\n");
}

TEST_F(KvlsimToolTest, SocketGoesWithItsProcess) {
    EXPECT_EQ(hold().finish().status, 0);
    EXPECT_NE(access(socket().c_str(), F_OK), 0);
}

TEST_F(KvlsimToolTest, SocketOfAKilledProcessIsReplaced) {
    hold().kill();
    EXPECT_EQ(holder->finish().status, 1009);
    EXPECT_EQ(access(socket().c_str(), F_OK), 0);
    hold();
    succeed({"show"});
}

TEST_F(KvlsimToolTest, SocketInUseIsRefusedAndItsOwnerKeepsIt) {
    hold();
    ChildProcess second({KVLSIM_PLATFORM_HOLDER}, {"KVLSIM_SOCKET=" + socket()});
    EXPECT_EQ(second.readLine(), "ready");
    second.writeLine("read 1 NAME");
    EXPECT_EQ(second.readLine(), "value NX5-T1");
    EXPECT_EQ(second.finish().err, "kvlsim: control socket " + socket() +
                                       ": is in use by another process, choose another path; the "
                                       "platform goes on without control\n");
    succeed({"show"});
}

TEST_F(KvlsimToolTest, FileInTheSocketsPlaceIsLeftAlone) {
    write("socket", "precious");
    ChildProcess& process = hold();
    EXPECT_EQ(process.finish().err, "kvlsim: control socket " + socket() +
                                        ": is there and is no socket, choose another path; the "
                                        "platform goes on without control\n");
    std::stringstream text;
    text << std::ifstream(socket()).rdbuf();
    EXPECT_EQ(text.str(), "precious");
}

TEST_F(KvlsimToolTest, SocketPathThatIsTooLongIsRefused) {
    std::string const path = "/tmp/" + std::string(120, 'x');
    ChildProcess process({KVLSIM_PLATFORM_HOLDER}, {"KVLSIM_SOCKET=" + path});
    EXPECT_EQ(process.readLine(), "ready");
    EXPECT_THAT(process.finish().err, HasSubstr("more than 107 bytes"));
}

TEST_F(KvlsimToolTest, ProcessEndsCleanlyWhileEventsAreDelivered) {
    ChildProcess& process = hold();
    process.writeLine("flood 5000");
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0) << finished.err;
}

TEST_F(KvlsimToolTest, HandlerMayEndTheProcess) {
    ChildProcess& process = hold();
    process.writeLine("exit-in-handler");
    Finished const finished = process.finish();
    EXPECT_EQ(finished.status, 0) << finished.err;
}

TEST_F(KvlsimToolTest, ProcessEndsWhileAClientHangs) {
    ChildProcess& process = hold();
    int const client = ::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    std::strncpy(address.sun_path, socket().c_str(), sizeof address.sun_path - 1);
    ASSERT_EQ(connect(client, reinterpret_cast<sockaddr const*>(&address), sizeof address), 0);
    EXPECT_EQ(process.finish().status, 0);
    close(client);
}

} // namespace
