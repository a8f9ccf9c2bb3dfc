// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/TcpConnections.h"

#include <arpa/inet.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <optional>
#include <string>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using std::chrono::milliseconds;

constexpr std::chrono::seconds kPatience{60};

/// The shortest message of this content: a sequence of it.
std::string message(std::string const& content) {
    return std::string("\x30") + static_cast<char>(content.size()) + content;
}

class TcpConnectionsTest : public ::testing::Test {
  protected:
    void serve(TcpLimits const& limits) {
        m_connections.emplace(limits);
        for (m_port = 20000; !m_connections->listen("127.0.0.1:" + std::to_string(m_port));)
            ASSERT_LT(++m_port, 30000);
    }
    /// A connected client.
    int client() const {
        int const descriptor = socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_port = htons(static_cast<std::uint16_t>(m_port));
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        EXPECT_EQ(connect(descriptor, reinterpret_cast<sockaddr*>(&address), sizeof address), 0);
        return descriptor;
    }
    void turn() {
        std::vector<pollfd> polled;
        m_connections->prepare(polled);
        poll(polled.data(), polled.size(), 1);
        m_connections->handle(polled);
    }
    template <class Condition>
    bool runUntil(Condition condition) {
        auto const limit = Clock::now() + kPatience;
        while (!condition()) {
            if (Clock::now() > limit) return false;
            turn();
        }
        return true;
    }
    /// The next message, which must come.
    TcpConnections::Message next() {
        std::optional<TcpConnections::Message> taken;
        EXPECT_TRUE(runUntil([&] { return (taken = m_connections->take()).has_value(); }));
        return taken.value_or(TcpConnections::Message{});
    }

    std::optional<TcpConnections> m_connections;
    int m_port = 0;
};

TEST_F(TcpConnectionsTest, MessagesOfOneClientComeOneByOneInOrder) {
    serve({});
    int const asking = client();
    std::string const both = message("first") + message("second");
    send(asking, both.data(), both.size(), 0);
    EXPECT_EQ(next().octets, message("first"));
    EXPECT_EQ(next().octets, message("second"));
    close(asking);
}

TEST_F(TcpConnectionsTest, ClientsTakeTurns) {
    serve({});
    int const greedy = client();
    std::string const many = message("a") + message("b") + message("c");
    send(greedy, many.data(), many.size(), 0);
    EXPECT_EQ(next().octets, message("a"));
    int const modest = client();
    std::string const one = message("z");
    send(modest, one.data(), one.size(), 0);
    // Both have a message that is offered; the greedy client's third one comes last.
    EXPECT_TRUE(runUntil([&] { return m_connections->count() == 2; }));
    for (int i = 0; i < 20; ++i)
        turn();
    std::string const second = next().octets;
    std::string const third = next().octets;
    EXPECT_TRUE(second == one || third == one);
    close(greedy);
    close(modest);
}

TEST_F(TcpConnectionsTest, IdleClientIsDisconnected) {
    TcpLimits limits;
    limits.idle = milliseconds(20);
    serve(limits);
    int const idle = client();
    EXPECT_TRUE(runUntil([&] {
        char octet = 0;
        return recv(idle, &octet, 1, MSG_DONTWAIT) == 0;
    }));
    close(idle);
}

TEST_F(TcpConnectionsTest, ClientThatSendsAMessageForEverIsDisconnected) {
    TcpLimits limits;
    limits.idle = milliseconds(50);
    serve(limits);
    int const slow = client();
    std::string const start("\x30\x82\x40\x00", 4);
    send(slow, start.data(), start.size(), 0);
    EXPECT_TRUE(runUntil([&] {
        send(slow, "x", 1, MSG_DONTWAIT | MSG_NOSIGNAL);
        char octet = 0;
        return recv(slow, &octet, 1, MSG_DONTWAIT) == 0 || errno == ECONNRESET;
    }));
    close(slow);
}

TEST_F(TcpConnectionsTest, ClientThatDoesNotReadIsNotReadEither) {
    serve({});
    int const deaf = client();
    std::string const answer(60000, 'x');
    int answered = 0;
    // Ends when the client's message is no longer offered although the client sends on.
    int quiet = 0;
    auto const limit = Clock::now() + kPatience;
    while (quiet < 200 && Clock::now() < limit) {
        std::string const ask = message("more");
        send(deaf, ask.data(), ask.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
        turn();
        if (auto const taken = m_connections->take()) {
            m_connections->send(taken->connection, answer);
            ++answered;
            quiet = 0;
        } else {
            ++quiet;
        }
    }
    EXPECT_GE(quiet, 200);
    EXPECT_GT(answered, 1);
    // It is served again once it reads.
    EXPECT_TRUE(runUntil([&] {
        char buffer[65536];
        while (recv(deaf, buffer, sizeof buffer, MSG_DONTWAIT) > 0) {
        }
        return m_connections->take().has_value();
    }));
    close(deaf);
}

TEST_F(TcpConnectionsTest, NewClientReplacesTheLongestIdleOne) {
    TcpLimits limits;
    limits.connections = 3;
    serve(limits);
    int const first = client();
    EXPECT_TRUE(runUntil([&] { return m_connections->count() == 1; }));
    std::vector<int> others;
    for (int i = 0; i < 3; ++i)
        others.push_back(client());
    EXPECT_TRUE(runUntil([&] {
        char octet = 0;
        return recv(first, &octet, 1, MSG_DONTWAIT) == 0;
    }));
    EXPECT_EQ(m_connections->count(), 3U);
    close(first);
    for (int const other : others)
        close(other);
}

} // namespace
} // namespace kvloamd
