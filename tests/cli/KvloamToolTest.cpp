// SPDX-License-Identifier: BSD-2-Clause
// The real kvloam against an agent whose answers the test chooses.
#include <fstream>
#include <map>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "cli/Answer.h"
#include "cli/Text.h"
#include "tests/cli/FakeAgent.h"
#include "tests/cli/Samples.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using support::Finished;
using testing::HasSubstr;
using testing::Not;

class KvloamToolTest : public testing::Test {
  protected:
    KvloamToolTest() { start(); }

    /// `more`: answers beside the usual ones, or instead of them.
    void start(std::map<std::string, std::string> more = {}) {
        more.merge(std::map<std::string, std::string>{
            {"health", samples::kHealth},
            {"boards", samples::kBoards},
            {"boards/Z70002", samples::answer("\"board\":" + samples::kFailedBoard)},
            {"lines", samples::kLines},
            {"lines/nx5-trunk-1", samples::kLine},
            {"lines/1000", samples::kLine},
            {"alarms", samples::kAlarms},
            {"tables", R"({"tables":["kvlBoardTable","ifTable"]})"},
            {"tables/ifTable", R"({"table":"ifTable","rows":[{"index":[1],"ifDescr":"x"}]})"},
            {"scalars", R"({"scalars":{"kvlBoardCount":2}})"},
            {"journal?limit=50", samples::kJournal}});
        m_agent = std::make_unique<FakeAgent>(socket(), more);
    }
    std::string socket() const { return m_directory.file("socket"); }
    std::vector<std::string> environment() const {
        return {"KVLOAM_SOCKET=" + socket(), "LC_ALL=C.UTF-8", "TZ=UTC", "TERM=xterm", "COLUMNS="};
    }
    Finished kvloam(std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), KVLOAM_TOOL);
        return support::run(arguments, environment());
    }
    std::string succeed(std::vector<std::string> const& arguments) const {
        Finished const finished = kvloam(arguments);
        EXPECT_EQ(finished.status, 0) << finished.err;
        EXPECT_EQ(finished.err, "");
        return finished.out;
    }
    void expectRefusal(std::vector<std::string> const& arguments, int status,
                       std::string const& words) const {
        Finished const finished = kvloam(arguments);
        EXPECT_EQ(finished.status, status);
        EXPECT_THAT(finished.err, HasSubstr(words));
        EXPECT_EQ(finished.err.find('\n'), finished.err.size() - 1) << finished.err;
        EXPECT_EQ(finished.out, "");
    }
    /// The same on a terminal of this width.
    std::string onTerminal(std::string const& arguments, int width,
                           std::string const& variables = "") const {
        Finished const finished =
            support::run({"/usr/bin/script", "-qec",
                          "stty cols " + std::to_string(width) + " rows 24; exec env " + variables +
                              " " + KVLOAM_TOOL + " " + arguments,
                          "/dev/null"},
                         environment());
        EXPECT_EQ(finished.status, 0) << finished.err;
        return finished.out;
    }

    support::TemporaryDirectory m_directory;
    std::unique_ptr<FakeAgent> m_agent;
};

TEST_F(KvloamToolTest, WithoutACommandItShowsTheHealthOfEverything) {
    EXPECT_THAT(succeed({}), testing::StartsWith("host    gw1\nagent   version 0.1.0"));
}

TEST_F(KvloamToolTest, EveryCommandPrintsJson) {
    for (std::vector<std::string> arguments : {std::vector<std::string>{},
                                               {"boards"},
                                               {"board", "Z70002"},
                                               {"lines"},
                                               {"line", "nx5-trunk-1"},
                                               {"history", "nx5-trunk-1"},
                                               {"alarms"},
                                               {"journal"},
                                               {"health"},
                                               {"tables"},
                                               {"table", "ifTable"},
                                               {"scalars"}}) {
        arguments.emplace_back("--json");
        auto const read = kvloam::Json::parse(succeed(arguments), nullptr, false);
        EXPECT_TRUE(read.is_object()) << arguments.front();
    }
    EXPECT_EQ(kvloam::Json::parse(succeed({"--json", "boards"})),
              kvloam::Json::parse(samples::kBoards));
}

TEST_F(KvloamToolTest, EveryCommandPrintsText) {
    EXPECT_THAT(succeed({"boards"}), HasSubstr("NX50001"));
    EXPECT_THAT(succeed({"board", "Z70002"}), HasSubstr("Board Z70002: failed"));
    EXPECT_THAT(succeed({"lines"}), HasSubstr("LossOfSignal"));
    EXPECT_THAT(succeed({"line", "nx5-trunk-1"}), HasSubstr("Line nx5-trunk-1: LossOfSignal"));
    EXPECT_THAT(succeed({"history", "nx5-trunk-1"}), HasSubstr("Errored seconds (ES): 3"));
    EXPECT_THAT(succeed({"alarms"}), HasSubstr("boardFailed"));
    EXPECT_THAT(succeed({"journal"}), HasSubstr("the board has failed"));
    EXPECT_THAT(succeed({"health"}), HasSubstr("agent up time          2 h\n"));
    EXPECT_EQ(succeed({"tables"}), "kvlBoardTable\nifTable\n");
    EXPECT_EQ(succeed({"table", "ifTable"}), "index  ifDescr\n[1]    x\n");
    EXPECT_EQ(succeed({"scalars"}), "kvlBoardCount  2\n");
}

TEST_F(KvloamToolTest, TheHistoryOfAllLinesIsExported) {
    m_agent->answerApi("lines/1001", R"({"line":{"name":"gone","board":"B","intervals":[]}})");
    EXPECT_THAT(
        succeed({"history", "--openmetrics"}),
        HasSubstr("errored_seconds{board=\"NX50001\",line=\"nx5-trunk-1\"} 3 1795367700\n"));
}

TEST_F(KvloamToolTest, WhatDoesNotExistIsSaid) {
    expectRefusal({"board", "X"}, 1, "kvloam: there is no board X; kvloam boards lists them\n");
    expectRefusal({"line", "\033[2J"}, 1, "there is no line ?[2J; kvloam lines lists them\n");
    expectRefusal({"table", "x"}, 1, "there is no table x; kvloam tables lists them\n");
    expectRefusal({"board", ".."}, 2, "\"..\" is no name of a board\n");
    expectRefusal({"channels"}, 1, "is it an agent of this version?\n");
}

TEST_F(KvloamToolTest, AWrongCommandLineIsRefused) {
    for (std::vector<std::string> const& arguments :
         std::vector<std::vector<std::string>>{{"bords"},
                                               {"board"},
                                               {"boards", "x"},
                                               {"--no-such-option"},
                                               {"--timeout", "0"},
                                               {"--host", "h:1", "--socket", "s", "boards"},
                                               {"check", "x", "--json", "boards"},
                                               {"history", "--watch", "--openmetrics"},
                                               {"journal", "--limit", "0"}})
        if (arguments.front() != "check") expectRefusal(arguments, 2, "; kvloam --help explains\n");
}

TEST_F(KvloamToolTest, WithoutAnAgentItSaysWhatToStart) {
    m_agent.reset();
    for (char const* command : {"boards", "health", "alarms", "journal"})
        expectRefusal({command}, 3,
                      "kvloam: no agent at " + socket() +
                          " (No such file or directory); start it "
                          "with: systemctl start kvloamd\n");
}

TEST_F(KvloamToolTest, ThePluginsStatusIsTheStateOfEverything) {
    EXPECT_EQ(kvloam({"check"}).status, 2);
    EXPECT_THAT(kvloam({"check"}).out, testing::StartsWith("KVLOAM CRITICAL: "));
    m_agent->answerApi("alarms", samples::kNoAlarms);
    EXPECT_EQ(kvloam({"check"}).status, 0);
    EXPECT_THAT(kvloam({"check", "--json"}).out, HasSubstr("\"status\": 0"));
    m_agent->answerApi("alarms", "[]");
    EXPECT_EQ(kvloam({"check"}).status, 3);
    EXPECT_EQ(kvloam({"check", "--critical", "nonsense"}).status, 3);
    m_agent.reset();
    Finished const away = kvloam({"check"});
    EXPECT_EQ(away.status, 3);
    EXPECT_THAT(away.out, testing::StartsWith("KVLOAM UNKNOWN: no agent at "));
    EXPECT_EQ(away.err, "");
}

TEST_F(KvloamToolTest, AHostIsAskedByTcp) {
    FakeAgent remote;
    remote.answerApi("boards", R"({"boards":[]})");
    EXPECT_EQ(succeed({"--host", remote.host(), "boards"}), "no boards\n");
    EXPECT_EQ(succeed({"boards", "--host", "http://" + remote.host() + "/"}), "no boards\n");
    EXPECT_TRUE(m_agent->requests().empty());
}

TEST_F(KvloamToolTest, BadAnswersAreOneLine) {
    for (char const* answer : {"", "[]", "{}", "null", R"({"boards":{}})", R"({"boards":[1]})",
                               "{\"boards\":[{\"a\":"}) {
        m_agent->answerApi("boards", answer);
        expectRefusal({"boards"}, 1, "kvloam: the agent's answer cannot be read: ");
    }
}

TEST_F(KvloamToolTest, FollowedEntriesArePrintedAsTheyCome) {
    m_agent->answerApi("journal?after=8", R"({"entries":[{"number":9,"text":"the ninth"}]})");
    m_agent->answerApi("journal?after=9", R"({"entries":[{"number":10,"text":"the tenth"}]})");
    m_agent->answerApi("journal?after=10", R"({"entries":[]})");
    support::ChildProcess follower({"/bin/sh", "-c", "exec " KVLOAM_TOOL " journal --follow 2>&1"},
                                   environment());
    EXPECT_THAT(follower.readLine(), HasSubstr("started"));
    EXPECT_THAT(follower.readLine(), HasSubstr("the board has failed"));
    EXPECT_THAT(follower.readLine(), HasSubstr("the ninth"));
    EXPECT_THAT(follower.readLine(), HasSubstr("the tenth"));
    // The agent is started again, with another journal.
    m_agent.reset();
    EXPECT_THAT(follower.readLine(), HasSubstr("kvloam: no agent at "));
    start({{"journal?limit=1", R"({"entries":[{"number":2,"text":"x"}]})"},
           {"journal?after=0", R"({"entries":[{"number":2,"text":"another"}]})"},
           {"journal?after=2", R"({"entries":[{"number":3,"text":"the third"}]})"},
           {"journal?after=3", R"({"entries":[]})"}});
    EXPECT_THAT(follower.readLine(), HasSubstr("another"));
    EXPECT_THAT(follower.readLine(), HasSubstr("the third"));
    follower.signal(SIGTERM);
    EXPECT_EQ(follower.finish().status, 1000 + SIGTERM);
}

TEST_F(KvloamToolTest, WatchedJsonIsOneLineEachTime) {
    support::ChildProcess watcher({KVLOAM_TOOL, "boards", "--json", "--watch", "--interval", "0.1"},
                                  environment());
    for (int i = 0; i < 3; ++i)
        EXPECT_TRUE(kvloam::Json::accept(watcher.readLine()));
    watcher.signal(SIGTERM);
    watcher.finish();
}

TEST_F(KvloamToolTest, WatchingOutlivesTheAgent) {
    support::ChildProcess watcher({KVLOAM_TOOL, "alarms", "--watch", "--interval", "0.1"},
                                  environment());
    while (watcher.readLine().find("boardFailed") == std::string::npos) {
    }
    m_agent.reset();
    std::string line;
    while (line != "(end)" && line.find("kvloam: no agent at ") == std::string::npos)
        line = watcher.readLine();
    EXPECT_THAT(line, HasSubstr("no agent at"));
    start();
    while (line != "(end)" && line.find("boardFailed") == std::string::npos)
        line = watcher.readLine();
    EXPECT_THAT(line, HasSubstr("boardFailed"));
    watcher.signal(SIGTERM);
    watcher.finish();
}

TEST_F(KvloamToolTest, TablesFitTheTerminal) {
    for (int const width : {20, 40, 80, 132}) {
        std::istringstream lines(onTerminal("boards", width, "NO_COLOR=1"));
        for (std::string line; std::getline(lines, line);) {
            if (line.ends_with('\r')) line.pop_back();
            EXPECT_LE(kvloam::width(line), static_cast<std::size_t>(width)) << line;
        }
    }
}

TEST_F(KvloamToolTest, ColoursAreForTerminalsOnly) {
    EXPECT_THAT(onTerminal("boards", 80), HasSubstr("\033[1;31mfailed\033[0m"));
    EXPECT_THAT(onTerminal("boards", 80, "NO_COLOR=1"), Not(HasSubstr("\033")));
    EXPECT_THAT(onTerminal("boards", 80, "TERM=dumb"), Not(HasSubstr("\033")));
    EXPECT_THAT(succeed({"boards"}), Not(HasSubstr("\033")));
}

TEST_F(KvloamToolTest, AHostileAgentDoesNotReachTheTerminal) {
    std::string const hostile = R"("\u001b[2J\u009b31m\u0007\n")";
    m_agent->answerApi("boards", samples::answer(R"("boards":[{"serialNumber":)" + hostile +
                                                 R"(,"errorMessage":)" + hostile + "}]"));
    m_agent->answerApi("alarms", samples::answer(R"("alarms":[{"kind":)" + hostile +
                                                 R"(,"resource":)" + hostile + "}]"));
    m_agent->answerApi("journal?limit=50",
                       samples::answer(R"("entries":[{"text":)" + hostile + "}]"));
    m_agent->answerApi("lines/x", samples::answer("\"line\":{\"name\":" + hostile + "," + hostile +
                                                  R"(:"x","intervals":[{"number":1,"es":1}]})"));
    m_agent->answerApi("tables/t", R"({"rows":[{)" + hostile + ":" + hostile + "}]}");
    for (char const* command :
         {"boards", "alarms", "journal", "line x", "history x", "table t", "", "boards --json"}) {
        std::string const text = onTerminal(command, 80, "NO_COLOR=1");
        for (char const* octets : {"\033", "\007", "\xc2\x9b"})
            EXPECT_THAT(text, Not(HasSubstr(octets))) << command;
        EXPECT_GT(text.size(), 5U) << command;
    }
}

TEST_F(KvloamToolTest, TargetsAreMadeWithoutAnAgent) {
    m_agent.reset();
    std::string const list = m_directory.file("hosts");
    std::string const made = m_directory.file("targets.yml");
    std::ofstream(list) << "192.0.2.11 north gw1\n";
    std::string const printed = succeed({"fleet", "targets", list});
    EXPECT_THAT(printed, HasSubstr("- targets: [\"192.0.2.11:8161\"]\n"));
    EXPECT_EQ(succeed({"fleet", "targets", list, "--output", made}), "");
    std::ostringstream written;
    written << std::ifstream(made).rdbuf();
    EXPECT_EQ(written.str(), printed);
    expectRefusal({"fleet", "targets"}, 1, "standard input: lists no agent;");
    expectRefusal({"fleet", "targets", m_directory.file("none")}, 1, "cannot be read\n");
}

TEST_F(KvloamToolTest, NamesForCompletionAreOneInALine) {
    EXPECT_EQ(succeed({"--timeout", "60", "names", "board"}), "NX50001\nZ70002\n");
    EXPECT_EQ(succeed({"--timeout", "60", "names", "line"}), "nx5-trunk-1\nnx5-trunk-2\n");
    m_agent->answerApi("boards", R"-({"boards":[{"serialNumber":"a b"},{"serialNumber":"$(x)"},)-"
                                 R"({"serialNumber":"C"}]})");
    EXPECT_EQ(succeed({"--timeout", "60", "names", "board"}), "C\n");
    m_agent.reset();
    Finished const away = kvloam({"names", "board"});
    EXPECT_EQ(away.out + away.err, "");
}

TEST_F(KvloamToolTest, AClosedOutputIsAnError) {
    Finished const finished =
        support::run({"/bin/sh", "-c", "exec " KVLOAM_TOOL " boards > /dev/full"}, environment());
    EXPECT_EQ(finished.status, 1);
    EXPECT_EQ(finished.err, "kvloam: standard output cannot be written\n");
}

} // namespace
