// SPDX-License-Identifier: BSD-2-Clause
// kvlsim line, kvlsim call and generated lines, end to end: the real tool against a real process.
#include <fstream>
#include <memory>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <nlohmann/json.hpp>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using nlohmann::json;
using support::ChildProcess;
using support::Finished;
using testing::HasSubstr;

class KvlsimLineToolTest : public ToolTest {
  protected:
    KvlsimLineToolTest() { hold(); }

    json listed(char const* what, char const* list, char const* key, int handle) const {
        json const reply = json::parse(succeed({what, "list", "--json"}));
        for (auto const& each : reply[list])
            if (each[key] == handle) return each;
        return {};
    }
    json line(int handle) const { return listed("line", "lines", "line", handle); }
    json trunk(int handle) const { return listed("call", "trunks", "trunk", handle); }
};

TEST_F(KvlsimLineToolTest, ListIsATable) {
    succeed({"line", "alarm", "102", "los"});
    std::string const table = succeed({"line", "list"});
    EXPECT_THAT(table, testing::StartsWith("LINE  NAME "));
    EXPECT_THAT(table, HasSubstr("102   nx5-trunk-2          1      esf "));
    EXPECT_THAT(table, HasSubstr("201   quillon-span-1       2      e1-crc "));
    EXPECT_THAT(table, HasSubstr("los, sending-rai\n"));
}

TEST_F(KvlsimLineToolTest, ErrorsCountAtOnce) {
    succeed({"line", "errors", "102", "--code-violations", "900", "--path-violations", "5",
             "--framing-errors", "3", "--slips", "1"});
    EXPECT_EQ(line(102)["errors"], json::parse(R"({"code-violations": 900, "path-violations": 5,
                                                   "framing-errors": 3, "slips": 1})"));
}

TEST_F(KvlsimLineToolTest, RatesAreSet) {
    succeed({"line", "rates", "nx5-trunk-2", "--code-violations", "2.5", "--slips", "1e-3"});
    EXPECT_EQ(line(102)["rates"], json::parse(R"({"code-violations": 2.5, "path-violations": 0,
                                                  "framing-errors": 0, "slips": 0.001})"));
}

TEST_F(KvlsimLineToolTest, AlarmsAreAnnouncedWhenTheToolReturns) {
    succeed({"line", "alarm", "102", "lof"});
    succeed({"line", "alarm", "102", "lof"});
    succeed({"line", "alarm", "102", "lof", "--clear"});
    succeed({"line", "alarm", "102", "rai"});
    succeed({"line", "mend", "102"});
    holder->writeLine("read 1 NAME");
    for (char const* expected :
         {"event 30001 1", "event 30002 1", "event 30001 1", "event 30002 1", "value NX5-T1"})
        EXPECT_EQ(holder->readLine(), expected);
    EXPECT_EQ(line(102)["alarms"], json::array());
}

TEST_F(KvlsimLineToolTest, WrongUseOfLinesIsRefused) {
    expectRefusal({"line"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"line", "errors", "102"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"line", "errors", "102", "--slips", "1.5"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"line", "rates", "102", "--slips", "-1"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"line", "alarm", "102"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"line", "alarm", "102", "red"}, 1, "kvlsim: no alarm is called \"red\"; ");
    expectRefusal({"line", "mend", "103"}, 1,
                  "kvlsim: device 103 has no line; \"kvlsim line list\" lists those that have\n");
}

TEST_F(KvlsimLineToolTest, ShowDescribesLineAndChannels) {
    std::string const text = succeed({"show", "3"});
    EXPECT_THAT(text, HasSubstr("line: e1-crc, no alarms, no steady errors\n"));
    EXPECT_THAT(text, HasSubstr("channels: 30 bearers, signalling l2\n"));
}

TEST_F(KvlsimLineToolTest, InsertedBoardBringsItsLinesAndChannels) {
    succeed({"insert", write("board.yaml", "handle: 50\n"
                                           "attributes: {SERIAL_NUMBER: \"FILE\"}\n"
                                           "devices:\n"
                                           "  - handle: 501\n"
                                           "    type: 514\n"
                                           "    line: {type: e1, alarms: [rai], errors: {slips: "
                                           "0.25}, past: {seconds: 100}}\n"
                                           "    channels: {bearers: 4, signalling: inactive}\n")});
    EXPECT_EQ(line(501)["alarms"], json::array({"rai"}));
    EXPECT_EQ(line(501)["rates"]["slips"], 0.25);
    EXPECT_GE(line(501)["seconds"], 100);
    EXPECT_EQ(trunk(501)["channels"].size(), 4U);
    EXPECT_EQ(trunk(501)["signalling"], "inactive");
    succeed({"remove", "50"});
    EXPECT_EQ(line(501), json());
    EXPECT_EQ(trunk(501), json());
}

TEST_F(KvlsimLineToolTest, CallsAreSetUpAndReleased) {
    EXPECT_EQ(succeed({"call", "setup", "301"}), "channel 1\n");
    EXPECT_EQ(succeed({"call", "setup", "301", "5", "--state", "connecting"}), "channel 5\n");
    EXPECT_EQ(succeed({"call", "setup", "vorn-primary-rate-1"}), "channel 2\n");
    json channels = trunk(301)["channels"];
    EXPECT_EQ(channels[0], "active");
    EXPECT_EQ(channels[1], "active");
    EXPECT_EQ(channels[4], "connecting");
    EXPECT_THAT(succeed({"call", "list"}),
                HasSubstr("301    vorn-primary-rate-1  3      l2          30       27    1         "
                          "  0          2\n"));
    succeed({"call", "release", "301", "5"});
    EXPECT_EQ(trunk(301)["channels"][4], "idle");
    succeed({"call", "release", "301", "--all"});
    EXPECT_EQ(trunk(301)["channels"][0], "idle");
    succeed({"call", "signalling", "301", "l1"});
    EXPECT_EQ(trunk(301)["signalling"], "l1");
}

TEST_F(KvlsimLineToolTest, WrongUseOfCallsIsRefused) {
    expectRefusal({"call"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"call", "setup"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"call", "release", "301"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"call", "release", "301", "1", "--all"}, 2, "; kvlsim --help explains\n");
    expectRefusal({"call", "setup", "301", "31"}, 1,
                  "kvlsim: \"channel\" cannot be \"31\"; write a whole number from 1 to 30\n");
    expectRefusal(
        {"call", "setup", "101"}, 1,
        "kvlsim: device 101 has no channels; \"kvlsim call list\" lists those that have\n");
}

TEST_F(KvlsimLineToolTest, ScriptRunsItsLines) {
    succeed({"call", "script",
             write("calls", "# two calls, one of which ends\n"
                            "\n"
                            "setup 301 3\n"
                            "setup 301 7 connected   # not answered\n"
                            "setup 303\n"
                            "wait 0.01\n"
                            "release 301 3\n"
                            "release 303 all\n"
                            "signalling 303 inactive\n")});
    EXPECT_EQ(trunk(301)["channels"][2], "idle");
    EXPECT_EQ(trunk(301)["channels"][6], "connected");
    EXPECT_EQ(trunk(303)["channels"][0], "idle");
    EXPECT_EQ(trunk(303)["signalling"], "inactive");
}

TEST_F(KvlsimLineToolTest, ScriptIsReadFromStandardInput) {
    ChildProcess script({KVLSIM_TOOL, "call", "script", "-"},
                        {"KVLSIM_SOCKET=" + directory.file("socket")});
    script.writeLine("setup 301 3");
    script.writeLine("setup 301 3");
    Finished const finished = script.finish();
    EXPECT_EQ(finished.status, 1);
    EXPECT_EQ(finished.err, "kvlsim: standard input:2: channel 3 of trunk 301 is active; release "
                            "it first\n");
    EXPECT_EQ(trunk(301)["channels"][2], "active");
}

TEST_F(KvlsimLineToolTest, ScriptStopsAtItsFirstErrorAndNamesTheLine) {
    struct {
        char const* line;
        char const* error;
    } constexpr scripts[] = {
        {"call 301", "unknown command \"call\"; write setup, release, signalling or wait"},
        {"setup", "this is no setup; write setup TRUNK [CHANNEL [STATE]]"},
        {"release 301", "this is no release; write release TRUNK CHANNEL, or release TRUNK all"},
        {"signalling 301", "this is no signalling; write signalling TRUNK inactive, l1 or l2"},
        {"wait", "this is no wait; write wait SECONDS"},
        {"wait long", "cannot wait \"long\"; write seconds from 0 to 86400, such as 0.5"},
        {"release 301 1", "channel 1 of trunk 301 is idle; there is no call to release"},
    };
    for (auto const& [line, error] : scripts) {
        std::string const path = write("calls", std::string("# x\n") + line + "\nsetup 303 1\n");
        expectRefusal({"call", "script", path}, 1, "kvlsim: " + path + ":2: " + error + "\n");
    }
    EXPECT_EQ(trunk(303)["channels"][0], "idle") << "went on behind an error";
}

TEST_F(KvlsimLineToolTest, ScriptThatIsNotThereIsRefused) {
    expectRefusal({"call", "script", "/no/such/file"}, 1,
                  "kvlsim: /no/such/file: cannot be read; name a script that is readable\n");
    expectRefusal({"call", "script", directory.file(".")}, 1,
                  ": cannot be read; name a script that is readable\n");
}

TEST_F(KvlsimLineToolTest, GeneratedLinesAreOfTheBoardsType) {
    std::string const path = directory.file("lines.yaml");
    succeed({"generate", "--boards", "20", "--lines", "3", "--seed", "5", "--output", path});
    hold({"KVLSIM_CHASSIS=" + path});
    json const lines = json::parse(succeed({"line", "list", "--json"}))["lines"];
    ASSERT_EQ(lines.size(), 60U);
    int e1 = 0;
    for (auto const& each : lines) {
        bool const isE1 = each["board-name"].get<std::string>().ends_with("-E1");
        e1 += isE1 ? 1 : 0;
        EXPECT_EQ(each["type"], isE1 ? 5 : 2) << each;
    }
    EXPECT_GT(e1, 0);
    EXPECT_LT(e1, 60);
}

TEST_F(KvlsimLineToolTest, SameSeedMakesTheSameLines) {
    std::vector<std::string> const command = {"generate", "--boards", "3", "--lines", "2"};
    std::string const one = succeed(command);
    EXPECT_THAT(one, HasSubstr("--seed 1 --lines 2\n"));
    EXPECT_EQ(succeed(command), one);
}

TEST_F(KvlsimLineToolTest, ChassisWithoutLinesHasNone) {
    EXPECT_THAT(succeed({"generate", "--boards", "5"}), testing::Not(HasSubstr("line")));
}

} // namespace
