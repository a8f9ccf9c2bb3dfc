// SPDX-License-Identifier: BSD-2-Clause
// The real agent over HTTP.
#include <sys/stat.h>

#include <csignal>
#include <filesystem>

#include <gmock/gmock.h>

#include "tests/e2e/HttpFixture.h"

namespace kvloamd::e2e {
namespace {

using support::HttpClient;
using ::testing::HasSubstr;

class HttpTest : public HttpFixture {
  protected:
    /// Starts the agent with a TCP port of its own.
    void startTcpAgent(std::vector<std::string> const& arguments = {}) {
        m_tcp = freePort();
        std::vector<std::string> all{"--http", "127.0.0.1:" + std::to_string(m_tcp)};
        all.insert(all.end(), arguments.begin(), arguments.end());
        startHttpAgent(all);
    }
    std::string tokenFile(std::string const& token) const {
        write(path("token"), token + "\n");
        chmod(path("token").c_str(), 0600);
        return path("token");
    }
    int statusWith(std::string const& token) const {
        return HttpClient(m_tcp)
            .ask("/api/v1/health", "Authorization: Bearer " + token + "\r\n")
            .status;
    }

    int m_tcp = 0;
};

TEST_F(HttpTest, EveryAnswerIsAsTheDocumentSays) {
    startHttpAgent();
    // Not the board that has channels.
    sim({"fail", "1"});
    EXPECT_TRUE(eventually([this] { return !document("alarms")["alarms"].empty(); }));
    Result const checked = run(
        {SOURCE_DIR "/tests/clients/check-openapi", SOURCE_DIR "/docs/openapi.json", socketPath()});
    EXPECT_EQ(checked.status, 0) << checked.output;
    EXPECT_THAT(checked.output, HasSubstr("answers are as described"));
}

TEST_F(HttpTest, ChangeOfABoardAppears) {
    startHttpAgent();
    std::string const board = document("boards")["boards"][0]["serialNumber"];
    EXPECT_EQ(document("boards/" + board)["board"]["status"], "started");
    sim({"stop", "1"});
    EXPECT_TRUE(
        eventually([&] { return document("boards/" + board)["board"]["status"] == "stopped"; }));
    EXPECT_TRUE(eventually([&] {
        auto const entries = document("journal")["entries"];
        return std::ranges::any_of(entries, [&](auto const& entry) {
            return entry["event"] == "boardStatus" && entry["board"] == board;
        });
    }));
}

TEST_F(HttpTest, JournalIsFollowedByNumbers) {
    startHttpAgent();
    EXPECT_TRUE(eventually([this] { return document("journal")["newest"] > 0; }));
    auto const last = document("journal")["newest"].get<int>();
    EXPECT_TRUE(document("journal?after=" + std::to_string(last))["entries"].empty());
    sim({"stop", "1"});
    EXPECT_TRUE(eventually([&] {
        auto const fresh = document("journal?after=" + std::to_string(last))["entries"];
        return !fresh.empty() && fresh[0]["number"] > last;
    }));
}

TEST_F(HttpTest, WhatAnOperatorSetsAppears) {
    configureSnmp("rwcommunity public 127.0.0.1\n");
    startHttpAgent();
    auto const line = document("lines")["lines"][0];
    std::string const index = std::to_string(line["ifIndex"].get<int>());
    EXPECT_EQ(ask("snmpset", {"1.3.6.1.2.1.31.1.1.1.18." + index, "s", "to the carrier"}).status,
              0);
    EXPECT_TRUE(eventually(
        [&] { return document("lines/" + index)["line"]["alias"] == "to the carrier"; }));
}

TEST_F(HttpTest, SocketIsForTheUserAndTheGroupAndGoesWithTheAgent) {
    startHttpAgent();
    struct stat found {};
    ASSERT_EQ(stat(socketPath().c_str(), &found), 0);
    EXPECT_TRUE(S_ISSOCK(found.st_mode));
    EXPECT_EQ(found.st_mode & 07777, 0660U);
    EXPECT_EQ(stopAgent(), 0);
    EXPECT_FALSE(std::filesystem::exists(socketPath()));
}

TEST_F(HttpTest, SocketOfAKilledAgentIsReplaced) {
    startHttpAgent();
    agent().signal(SIGKILL);
    agent().wait();
    EXPECT_TRUE(std::filesystem::exists(socketPath()));
    startHttpAgent();
    EXPECT_FALSE(document("boards")["boards"].empty());
}

TEST_F(HttpTest, SocketOfARunningAgentIsLeftAlone) {
    startHttpAgent();
    Result const second = runAgent({"--port", std::to_string(freePort()), "--module-dir",
                                    moduleDirectory(), "--module", "z7sim", "--persistent-dir",
                                    path("other"), "--http-socket", socketPath()});
    EXPECT_EQ(second.status, 1);
    EXPECT_THAT(second.output, HasSubstr("another process listens at " + socketPath()));
    EXPECT_FALSE(document("boards")["boards"].empty());
}

TEST_F(HttpTest, TcpAnswersToItsOwnNamesOnly) {
    startTcpAgent();
    EXPECT_EQ(HttpClient(m_tcp).ask("/api/v1/boards").status, 200);
    HttpClient other(m_tcp);
    other.send("GET /api/v1/boards HTTP/1.1\r\nHost: evil.example\r\n\r\n");
    EXPECT_EQ(other.read().status, 403);
    HttpClient none(m_tcp);
    none.send("GET /api/v1/boards HTTP/1.0\r\n\r\n");
    EXPECT_EQ(none.read().status, 403);
}

TEST_F(HttpTest, TokenIsReadAgainAtSighup) {
    std::string const first = "first-0123456789";
    std::string const second = "second-0123456789";
    startTcpAgent({"--http-token-file", tokenFile(first)});
    EXPECT_EQ(HttpClient(m_tcp).ask("/api/v1/health").status, 401);
    EXPECT_EQ(statusWith(first), 200);
    EXPECT_FALSE(document("boards")["boards"].empty()); // needs none at the socket
    tokenFile(second);
    agent().signal(SIGHUP);
    EXPECT_TRUE(eventually([&] { return statusWith(second) == 200; }));
    EXPECT_EQ(statusWith(first), 401);
}

TEST_F(HttpTest, BadTokenKeepsTheFormerOne) {
    std::string const first = "first-0123456789";
    startTcpAgent({"--http-token-file", tokenFile(first)});
    tokenFile("short");
    agent().signal(SIGHUP);
    EXPECT_TRUE(agent().waitFor("keeping the previous token"));
    EXPECT_EQ(statusWith(first), 200);
}

TEST_F(HttpTest, AddressForOtherHostsNeedsAToken) {
    std::string const address = "0.0.0.0:" + std::to_string(freePort());
    std::vector<std::string> arguments{
        "--port", std::to_string(freePort()), "--module-dir", moduleDirectory(), "--module",
        "z7sim",  "--persistent-dir",         path("state"),  "--http",          address};
    Result const refused = runAgent(arguments);
    EXPECT_EQ(refused.status, 1);
    EXPECT_THAT(refused.output, HasSubstr("--http-token-file"));
    arguments.emplace_back("--check-config");
    EXPECT_EQ(runAgent(arguments).status, 1);
    arguments.insert(arguments.end(), {"--http-token-file", tokenFile("0123456789abcdef")});
    Result const checked = runAgent(arguments);
    EXPECT_EQ(checked.status, 0) << checked.output;
}

TEST_F(HttpTest, CheckFindsWhatAStartWouldRefuse) {
    write(path("file"), "text");
    for (std::vector<std::string> const& wrong :
         {std::vector<std::string>{"--http-socket", path("file")},
          {"--http-socket", path("nothing/socket")},
          {"--http", "192.0.2.1:8161"},
          {"--http", "8161", "--http-token-file", path("nothing")}}) {
        std::vector<std::string> arguments{"--check-config", "--module-dir", moduleDirectory(),
                                           "--persistent-dir", path("state")};
        arguments.insert(arguments.end(), wrong.begin(), wrong.end());
        Result const checked = runAgent(arguments);
        EXPECT_EQ(checked.status, 1) << wrong.back();
        EXPECT_THAT(checked.output, HasSubstr("--http"));
    }
}

TEST_F(HttpTest, StopDoesNotWaitForClients) {
    startTcpAgent();
    HttpClient idle(m_tcp);
    EXPECT_EQ(idle.ask("/api/v1/health").status, 200);
    HttpClient half(socketPath());
    half.send("GET /api/v1/lines HTTP/1.1\r\n");
    EXPECT_EQ(stopAgent(), 0);
    EXPECT_TRUE(idle.isEnded());
    EXPECT_TRUE(half.isEnded());
}

TEST_F(HttpTest, NoSocketIsOpenedUnlessAsked) {
    startAgent({"--http-socket", ""});
    EXPECT_EQ(agent().output().find("answering HTTP"), std::string::npos);
}

} // namespace
} // namespace kvloamd::e2e
