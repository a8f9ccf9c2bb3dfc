// SPDX-License-Identifier: BSD-2-Clause
// The server with real clients, also bad ones.
#include "agent/fronts/http/HttpServer.h"

#include <sys/stat.h>

#include <filesystem>
#include <fstream>
#include <optional>

#include <gmock/gmock.h>

#include "agent/objects/OwnObjects.h"
#include "tests/support/HttpClient.h"
#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

using support::HttpClient;
using support::HttpReply;
using ::testing::AnyOf;
using ::testing::HasSubstr;

constexpr char kBoards[] = "/api/v1/boards";

/// A server at a Unix socket.
class HttpServerTest : public ::testing::Test {
  protected:
    void start(HttpLimits limits = {}) {
        m_sockets.push_back(ListeningSocket::unixAt(path()));
        m_server.emplace(m_sockets,
                         HttpServed{{tables(), {scalars()}},
                                    m_counters,
                                    m_settings,
                                    [this] { return m_snapshot; },
                                    [](JournalQuery const&) { return JournalPage{}; },
                                    [] { return std::uint32_t{0}; }},
                         "", limits);
    }
    std::string path() const { return m_folder.file("http.socket"); }

    support::TemporaryDirectory m_folder;
    Counters m_counters;
    Settings m_settings;
    std::shared_ptr<Snapshot const> m_snapshot = std::make_shared<Snapshot>();
    std::vector<ListeningSocket> m_sockets;
    std::optional<HttpServer> m_server;
};

TEST_F(HttpServerTest, ConnectionServesSeveralRequests) {
    start();
    HttpClient client(path());
    HttpReply const first = client.ask(kBoards);
    EXPECT_EQ(first.status, 200);
    EXPECT_EQ(first.fields.at("content-type"), "application/json");
    EXPECT_THAT(first.body, HasSubstr("\"boards\":[]"));
    EXPECT_EQ(client.ask(kBoards, "If-None-Match: " + first.fields.at("etag") + "\r\n").status,
              304);
    EXPECT_EQ(client.ask("/nothing").status, 404);
}

TEST_F(HttpServerTest, RequestsThatFollowAtOnceAreAnsweredInTurn) {
    start();
    HttpClient client(path());
    std::string const request = "GET /api/v1/boards HTTP/1.1\r\nHost: x\r\n\r\n";
    client.send(request + request + "GET /nothing HTTP/1.1\r\nHost: x\r\n\r\n");
    EXPECT_EQ(client.read().status, 200);
    EXPECT_EQ(client.read().status, 200);
    EXPECT_EQ(client.read().status, 404);
}

TEST_F(HttpServerTest, HeadHasTheFieldsWithoutTheBody) {
    start();
    HttpClient client(path());
    HttpReply const whole = client.ask(kBoards);
    HttpReply const head = client.ask(kBoards, {}, "HEAD");
    EXPECT_EQ(head.status, 200);
    EXPECT_EQ(head.fields.at("content-length"), std::to_string(whole.body.size()));
    EXPECT_EQ(client.ask(kBoards).status, 200); // no body was in between
}

TEST_F(HttpServerTest, BodyOfARequestIsNotRead) {
    start();
    HttpClient client(path());
    HttpReply const reply = client.ask(kBoards, "Content-Length: 1000000000\r\n", "POST");
    EXPECT_EQ(reply.status, 405);
    EXPECT_EQ(reply.fields.at("allow"), "GET, HEAD");
    EXPECT_TRUE(client.isEnded());
    HttpClient chunked(path());
    EXPECT_EQ(chunked.ask(kBoards, "Transfer-Encoding: chunked\r\n", "PUT").status, 405);
}

TEST_F(HttpServerTest, SizesOfTargetAndHeaderAreLimited) {
    start();
    EXPECT_EQ(HttpClient(path()).ask('/' + std::string(3000, 'x')).status, 414);
    EXPECT_EQ(HttpClient(path()).ask('/' + std::string(100000, 'x')).status, 414);
    EXPECT_EQ(HttpClient(path()).ask("/", "X: " + std::string(10000, 'x') + "\r\n").status, 431);
    EXPECT_EQ(HttpClient(path()).ask("/", "X: " + std::string(200000, 'x') + "\r\n").status, 431);
    EXPECT_EQ(HttpClient(path()).ask(kBoards).status, 200);
}

TEST_F(HttpServerTest, WhatIsNoRequestEndsTheConnection) {
    start({.patience = std::chrono::seconds(1)}); // what never becomes a request is cut
    for (std::string const& octets :
         {std::string("\r\n\r\n\r\n nonsense \r\n\r\n"), std::string(5000, '\0') + "\r\n\r\n",
          std::string("GET\r\n\r\n"), std::string("\x16\x03\x01\x02 TLS\r\n\r\n")}) {
        HttpClient client(path());
        client.send(octets);
        int const status = client.read().status;
        EXPECT_TRUE(status == 0 || status >= 400) << status;
    }
    EXPECT_EQ(HttpClient(path()).ask(kBoards).status, 200);
}

TEST_F(HttpServerTest, ClientThatSendsTooSlowlyIsCut) {
    start({.patience = std::chrono::milliseconds(100)});
    HttpClient client(path());
    // Something arrives all the time, but no whole request.
    client.send("GET /api/v1/boards HTTP/1.1\r\n");
    bool isTaken = true;
    auto const deadline = Clock::now() + std::chrono::minutes(1);
    while (isTaken && !client.hears(std::chrono::milliseconds(10)) && Clock::now() < deadline)
        isTaken = client.send("X: y\r\n");
    EXPECT_TRUE(client.isEnded());
}

TEST_F(HttpServerTest, ClientThatDoesNotReadIsCut) {
    auto snapshot = std::make_shared<Snapshot>();
    snapshot->boards.resize(10000);
    m_snapshot = snapshot;
    start({.patience = std::chrono::milliseconds(100)});
    HttpClient idle(path());
    idle.send("GET /api/v1/boards HTTP/1.1\r\nHost: x\r\n\r\n");
    // The idle client's answer is larger than what the system keeps for it. A connection that is
    // open only afterwards is cut later.
    HttpClient later(path());
    EXPECT_TRUE(later.isEnded());
    EXPECT_EQ(idle.read().status, 0);
}

TEST_F(HttpServerTest, AnswersThatNobodyReadsAreLimited) {
    auto snapshot = std::make_shared<Snapshot>();
    snapshot->boards.resize(10000);
    m_snapshot = snapshot;
    start({.patience = std::chrono::hours(1), .octets = 1U << 20U});
    EXPECT_EQ(HttpClient(path()).ask(kBoards).status, 503);
    EXPECT_EQ(HttpClient(path()).ask("/api/v1/health").status, 200);
    EXPECT_EQ(HttpClient(path()).ask(kBoards, {}, "HEAD").status, 503);
}

TEST_F(HttpServerTest, AnswersThatWereReadCountNoMore) {
    auto snapshot = std::make_shared<Snapshot>();
    snapshot->boards.resize(1000);
    m_snapshot = snapshot;
    start();
    std::size_t const size = HttpClient(path()).ask(kBoards).body.size();
    m_server.reset();
    m_sockets.clear();
    start({.octets = size + size / 2});
    HttpClient client(path());
    for (int i = 0; i < 10; ++i)
        EXPECT_EQ(client.ask(kBoards).status, 200);
}

TEST_F(HttpServerTest, ConnectionThatAsksAgainInTimeStays) {
    start({.patience = std::chrono::seconds(20)});
    HttpClient client(path());
    for (int i = 0; i < 50; ++i)
        EXPECT_EQ(client.ask(kBoards).status, 200);
}

TEST_F(HttpServerTest, FurtherConnectionsWait) {
    start({.connections = 3, .patience = std::chrono::hours(1)});
    std::vector<std::unique_ptr<HttpClient>> clients;
    for (int i = 0; i < 3; ++i) {
        clients.push_back(std::make_unique<HttpClient>(path()));
        EXPECT_EQ(clients.back()->ask(kBoards).status, 200);
    }
    HttpClient waiting(path());
    waiting.send("GET /api/v1/boards HTTP/1.1\r\nHost: x\r\n\r\n");
    // The others are served as before; the new one is not.
    for (auto& client : clients)
        EXPECT_EQ(client->ask(kBoards).status, 200);
    EXPECT_FALSE(waiting.hears(std::chrono::milliseconds(0)));
    clients.pop_back();
    EXPECT_EQ(waiting.read().status, 200);
}

TEST_F(HttpServerTest, ManyConnectionsAreServed) {
    start();
    std::vector<std::unique_ptr<HttpClient>> clients;
    for (int i = 0; i < 60; ++i)
        clients.push_back(std::make_unique<HttpClient>(path()));
    for (auto& client : clients)
        client->send("GET /api/v1/boards HTTP/1.1\r\nHost: x\r\n\r\n");
    for (auto& client : clients)
        EXPECT_EQ(client->read().status, 200);
}

TEST_F(HttpServerTest, StopEndsConnections) {
    start();
    HttpClient idle(path());
    EXPECT_EQ(idle.ask(kBoards).status, 200);
    HttpClient half(path());
    half.send("GET /api/v1");
    m_server.reset();
    EXPECT_TRUE(idle.isEnded());
    m_sockets.clear();
    EXPECT_TRUE(half.isEnded());
}

/// Sockets without a server.
class HttpSocketsTest : public ::testing::Test {
  protected:
    std::string file(std::string const& name) const { return m_folder.file(name.c_str()); }
    /// A file with a token and a mode.
    std::string tokenFile(std::string const& text, mode_t mode = 0640) const {
        std::string const name = file("token");
        std::ofstream(name) << text;
        chmod(name.c_str(), mode);
        return name;
    }

    support::TemporaryDirectory m_folder;
};

TEST_F(HttpSocketsTest, SocketIsForItsUserAndGroup) {
    auto const socket = ListeningSocket::unixAt(file("s"));
    struct stat found {};
    ASSERT_EQ(stat(file("s").c_str(), &found), 0);
    EXPECT_EQ(found.st_mode & 07777, 0660U);
    EXPECT_FALSE(std::filesystem::exists(file("s~")));
}

TEST_F(HttpSocketsTest, SocketBelongsToTheGroup) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can give a file to any group";
    auto const socket = ListeningSocket::unixAt(file("s"), "daemon");
    struct stat found {};
    ASSERT_EQ(stat(file("s").c_str(), &found), 0);
    EXPECT_EQ(found.st_gid, 1U);
}

TEST_F(HttpSocketsTest, SocketIsRemovedAtTheEnd) {
    { auto const socket = ListeningSocket::unixAt(file("s")); }
    EXPECT_FALSE(std::filesystem::exists(file("s")));
}

TEST_F(HttpSocketsTest, SocketThatWasLeftBehindIsReplaced) {
    int const dead = socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0);
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    file("s").copy(address.sun_path, sizeof address.sun_path - 1);
    ASSERT_EQ(bind(dead, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
    close(dead);
    auto const socket = ListeningSocket::unixAt(file("s"));
    EXPECT_NO_THROW(HttpClient client(file("s")));
}

TEST_F(HttpSocketsTest, SocketOfARunningServerStays) {
    auto const first = ListeningSocket::unixAt(file("s"));
    EXPECT_THROW(ListeningSocket::unixAt(file("s")), std::runtime_error);
    EXPECT_NO_THROW(HttpClient client(file("s")));
}

TEST_F(HttpSocketsTest, NewerSocketAtThePathStays) {
    auto first = std::make_optional(ListeningSocket::unixAt(file("s")));
    std::filesystem::remove(file("s"));
    auto const second = ListeningSocket::unixAt(file("s"));
    first.reset();
    EXPECT_NO_THROW(HttpClient client(file("s")));
}

TEST_F(HttpSocketsTest, FileThatIsNoSocketStays) {
    std::ofstream(file("s")) << "precious";
    EXPECT_THROW(ListeningSocket::unixAt(file("s")), std::runtime_error);
    EXPECT_EQ(std::filesystem::file_size(file("s")), 8U);
    EXPECT_THAT(checkUnixSocket(file("s")), HasSubstr("not a socket"));
}

TEST_F(HttpSocketsTest, PathsThatCannotBeAreRefused) {
    EXPECT_THROW(ListeningSocket::unixAt(file(std::string(200, 'x'))), std::runtime_error);
    EXPECT_THROW(ListeningSocket::unixAt(file("nothing/s")), std::runtime_error);
    EXPECT_THAT(checkUnixSocket(file(std::string(200, 'x'))), HasSubstr("characters"));
    EXPECT_THAT(checkUnixSocket(file("nothing/s")), HasSubstr("No such file"));
    EXPECT_EQ(checkUnixSocket(file("s")), "");
}

TEST_F(HttpSocketsTest, OnlyLoopbackNeedsNoToken) {
    EXPECT_EQ(checkTcpAddress("127.0.0.1:8999", false), "");
    // Not every host has IPv6.
    EXPECT_THAT(checkTcpAddress("[::1]:8999", true), AnyOf("", HasSubstr("cannot listen")));
    EXPECT_THAT(checkTcpAddress("0.0.0.0:8999", false), HasSubstr("--http-token-file"));
    EXPECT_EQ(checkTcpAddress("0.0.0.0:8999", true), "");
    EXPECT_THAT(checkTcpAddress("nonsense", false), HasSubstr("not an address"));
    EXPECT_THAT(checkTcpAddress("192.0.2.1:8999", true), HasSubstr("cannot listen"));
}

TEST_F(HttpSocketsTest, TokenIsTheFirstLine) {
    EXPECT_EQ(readToken(tokenFile("  0123456789abcdef \r\nmore\n")), "0123456789abcdef");
}

TEST_F(HttpSocketsTest, TokensThatAreWeakOrPublicAreRefused) {
    EXPECT_THROW(readToken(tokenFile("")), std::runtime_error);
    EXPECT_THROW(readToken(tokenFile("short")), std::runtime_error);
    EXPECT_THROW(readToken(tokenFile(std::string(513, 'x'))), std::runtime_error);
    EXPECT_THROW(readToken(tokenFile("0123456789 abcdef")), std::runtime_error);
    EXPECT_THROW(readToken(tokenFile("0123456789abcdef", 0644)), std::runtime_error);
    EXPECT_THROW(readToken(file("nothing")), std::runtime_error);
    EXPECT_THROW(readToken(m_folder.file("")), std::runtime_error);
}

} // namespace
} // namespace kvloamd
