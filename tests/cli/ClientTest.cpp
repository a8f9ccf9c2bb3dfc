// SPDX-License-Identifier: BSD-2-Clause
#include "cli/Client.h"

#include <fstream>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/cli/FakeAgent.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using kvloam::AgentAddress;
using kvloam::Client;
using kvloam::CliError;
using testing::HasSubstr;
using testing::Not;

class ClientTest : public testing::Test {
  protected:
    std::string socket() const { return m_directory.file("socket"); }
    AgentAddress address() const { return {socket(), "", ""}; }

    /// The status and message with which a question is given up.
    static std::pair<int, std::string> refusalOf(Client& client) {
        try {
            client.get({"boards"});
        } catch (CliError const& error) {
            return {error.status(), error.what()};
        }
        return {0, "(answered)"};
    }
    void expectRefusal(FakeAnswer answer, int status, std::string const& words) {
        FakeAgent agent(socket());
        agent.answer("/api/v1/boards", std::move(answer));
        Client client(address());
        auto const [gotStatus, message] = refusalOf(client);
        EXPECT_EQ(gotStatus, status);
        EXPECT_THAT(message, HasSubstr(words));
        EXPECT_THAT(message, Not(HasSubstr("\033")));
    }
    std::string write(char const* name, std::string const& text) const {
        std::ofstream(m_directory.file(name)) << text;
        return m_directory.file(name);
    }

    support::TemporaryDirectory m_directory;
};

TEST_F(ClientTest, AnAnswerIsRead) {
    FakeAgent agent(socket());
    agent.answerApi("boards", R"({"boards":[]})");
    Client client(address());
    EXPECT_EQ(client.get({"boards"}).dump(), R"({"boards":[]})");
    EXPECT_THAT(agent.requests().at(0), testing::StartsWith("GET /api/v1/boards HTTP/1.1\r\n"));
}

TEST_F(ClientTest, NamesAreEscaped) {
    FakeAgent agent(socket());
    agent.answer("/api/v1/lines/a%2F..%20%3F%0D%0Ab", {R"({"line":{}})"});
    Client client(address());
    EXPECT_TRUE(client.find({"lines", "a/.. ?\r\nb"}));
}

TEST_F(ClientTest, WhatDoesNotExistIsNoError) {
    FakeAgent agent(socket());
    Client client(address());
    EXPECT_FALSE(client.find({"lines", "x"}));
}

TEST_F(ClientTest, AMissingAgentIsNamedWithWhatToDo) {
    Client client(address());
    auto const [status, message] = refusalOf(client);
    EXPECT_EQ(status, kvloam::kNoAgent);
    EXPECT_EQ(message, "no agent at " + socket() +
                           " (No such file or directory); start it with: systemctl start kvloamd");
}

TEST_F(ClientTest, AHostWithoutAgentIsNamed) {
    std::string host;
    {
        FakeAgent const gone;
        host = gone.host();
    }
    Client client({"", host, ""});
    auto const [status, message] = refusalOf(client);
    EXPECT_EQ(status, kvloam::kNoAgent);
    EXPECT_EQ(message, "no agent at " + host +
                           " (Connection refused); start it there with: kvloamd --http ADDRESS");
}

TEST_F(ClientTest, AnAgentThatDoesNotAnswerIsGivenUp) {
    FakeAgent agent(socket());
    agent.answer("/api/v1/boards", {"", 200, "", false, true});
    AgentAddress impatient = address();
    impatient.timeout = std::chrono::milliseconds(50);
    Client client(impatient);
    EXPECT_EQ(refusalOf(client).first, kvloam::kNoAgent);
}

TEST_F(ClientTest, RefusalsAreToldInTheAgentsWords) {
    expectRefusal({R"({"error":{"status":409,"message":"several\u001b[2J lines"}})", 409}, 1,
                  "the agent refuses: several?[2J lines");
    expectRefusal({"<html>", 502}, 1, "the agent refuses: HTTP status 502");
    expectRefusal({R"({"error":{"message":"no token"}})", 401}, 1, "no token; give --token-file");
    expectRefusal({R"({"error":{"message":"starting"}})", 503}, 3, "the agent refuses: starting");
    // It was not asked whether anything has changed.
    expectRefusal({"", 304}, 1, "HTTP status 304");
    expectRefusal({"{}", 302, "Location: http://127.0.0.1:1/\r\n"}, 1, "HTTP status 302");
}

TEST_F(ClientTest, BadAnswersAreErrors) {
    expectRefusal({"", 200}, 1, "it is no JSON");
    expectRefusal({"SSH-2.0-x\r\n", 200, "", true}, 1, "cannot be read");
    expectRefusal({"", 200, "", true}, 1, "cannot be read");
    expectRefusal({"HTTP/1.1 200 OK\r\nContent-Length: 50\r\n\r\n{\"boards\":[", 200, "", true}, 1,
                  "cannot be read");
    expectRefusal({"HTTP/1.1 200 OK\r\nTransfer-Encoding: chunked\r\n\r\nzz\r\n", 200, "", true}, 1,
                  "cannot be read");
}

TEST_F(ClientTest, ALargeAnswerIsGivenUp) {
    FakeAgent agent(socket());
    agent.answerApi("boards", "{\"boards\":\"" + std::string(3U << 20U, 'x') + "\"}");
    Client client(address(), 1U << 20U);
    EXPECT_EQ(refusalOf(client).second, "the agent's answer is larger than 1 MiB");
}

TEST_F(ClientTest, TheTokenIsSent) {
    FakeAgent agent;
    agent.answerApi("boards", R"({"boards":[]})");
    Client client({"", agent.host(), write("token", "s3cret-token\r\nmore\n")});
    client.get({"boards"});
    EXPECT_THAT(agent.requests().at(0), HasSubstr("\r\nAuthorization: Bearer s3cret-token\r\n"));
}

TEST_F(ClientTest, AFileWithoutTokenIsRefused) {
    for (char const* text : {"", "\n", "two words\n", "escape\033\n"})
        EXPECT_THROW(Client({"", "h:1", write("token", text)}), CliError) << text;
    EXPECT_THROW(Client({"", "h:1", m_directory.file("none")}), CliError);
}

TEST_F(ClientTest, AnAnswerThatHasNotChangedIsNotSentAgain) {
    FakeAgent agent(socket());
    agent.answer("/api/v1/boards",
                 {R"({"boards":[],"ageSeconds":1.5})", 200, "ETag:  \"47\" \r\n"});
    Client client(address());
    client.keepAnswers();
    client.get({"boards"});
    agent.answer("/api/v1/boards", {"", 304});
    kvloam::Json const answer = client.get({"boards"});
    EXPECT_THAT(agent.requests().at(1), HasSubstr("\r\nIf-None-Match: \"47\"\r\n"));
    EXPECT_TRUE(answer.contains("boards"));
    EXPECT_GE(answer["ageSeconds"].get<double>(), 1.5);
}

TEST_F(ClientTest, WithoutWatchingNothingIsKept) {
    FakeAgent agent(socket());
    agent.answer("/api/v1/boards", {"{}", 200, "ETag: \"47\"\r\n"});
    Client client(address());
    client.get({"boards"});
    client.get({"boards"});
    EXPECT_THAT(agent.requests().at(1), Not(HasSubstr("If-None-Match")));
}

} // namespace
