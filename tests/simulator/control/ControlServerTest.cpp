// SPDX-License-Identifier: BSD-2-Clause
// The control socket, over a real connection: lines, errors, clients that misbehave.
#include "simulator/exports/Control.h"

#include <fcntl.h>
#include <poll.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstring>
#include <future>
#include <list>
#include <string>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "boardplatform/vqx_event_service.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using nlohmann::json;
using testing::HasSubstr;

support::TemporaryDirectory& directory() {
    static support::TemporaryDirectory made;
    return made;
}

std::string socketPath() {
    return directory().file("control");
}

/// A `SocketEnvironment` sets KVLSIM_SOCKET before all tests, because the platform opens its socket
/// when it starts.
class SocketEnvironment final : public testing::Environment {
  public:
    void SetUp() override { setenv("KVLSIM_SOCKET", socketPath().c_str(), 1); }
};

auto* const s_environment = testing::AddGlobalTestEnvironment(new SocketEnvironment);

/// A `Client` is a connection to the control socket.
class Client {
  public:
    Client() : m_socket(::socket(AF_UNIX, SOCK_STREAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::strncpy(address.sun_path, socketPath().c_str(), sizeof address.sun_path - 1);
        EXPECT_EQ(connect(m_socket, reinterpret_cast<sockaddr const*>(&address), sizeof address), 0)
            << std::strerror(errno);
    }
    ~Client() { close(); }
    Client(Client const&) = delete;
    Client& operator=(Client const&) = delete;

    void close() {
        if (m_socket >= 0) ::close(m_socket);
        m_socket = -1;
    }

    /// Sends all, or as much as the server takes before it closes the connection.
    void send(std::string const& text) {
        std::size_t sent = 0;
        while (sent < text.size()) {
            ssize_t const size =
                ::send(m_socket, text.data() + sent, text.size() - sent, MSG_NOSIGNAL);
            if (size <= 0) return;
            sent += static_cast<std::size_t>(size);
        }
    }

    /// Sends until the connection is full: the server no longer reads.
    void sendUntilFull(std::string const& text) {
        while (::send(m_socket, text.data(), text.size(), MSG_NOSIGNAL | MSG_DONTWAIT) > 0) {
        }
    }

    void endOfInput() { shutdown(m_socket, SHUT_WR); }

    bool readable(int milliseconds) const {
        pollfd polled{m_socket, POLLIN, 0};
        return poll(&polled, 1, milliseconds) > 0;
    }

    /// The next reply line; "(closed)" at the end.
    std::string line() {
        while (m_received.find('\n') == std::string::npos) {
            std::array<char, 4096> block{};
            if (!readable(60000)) return "(no answer)";
            ssize_t const size = recv(m_socket, block.data(), block.size(), 0);
            if (size <= 0) return "(closed)";
            m_received.append(block.data(), static_cast<std::size_t>(size));
        }
        auto const end = m_received.find('\n');
        std::string first = m_received.substr(0, end);
        m_received.erase(0, end + 1);
        return first;
    }

    json reply() { return json::parse(line(), nullptr, false); }

    json ask(std::string const& request) {
        send(request + "\n");
        return reply();
    }

  private:
    int m_socket;
    std::string m_received;
};

/// A `StandardError` makes the standard error of this process readable line by line.
class StandardError {
  public:
    StandardError() : m_before(dup(STDERR_FILENO)) {
        std::array<int, 2> ends{};
        EXPECT_EQ(pipe2(ends.data(), O_CLOEXEC), 0);
        dup2(ends[1], STDERR_FILENO);
        ::close(ends[1]);
        m_read = ends[0];
    }
    ~StandardError() {
        dup2(m_before, STDERR_FILENO);
        ::close(m_before);
        ::close(m_read);
    }
    StandardError(StandardError const&) = delete;
    StandardError& operator=(StandardError const&) = delete;

    /// Waits for a whole line, which it returns with its line end.
    std::string line() const {
        std::string text;
        for (char c = 0; c != '\n' && read(m_read, &c, 1) == 1;)
            text += c;
        return text;
    }

  private:
    int m_before;
    int m_read = -1;
};

class ControlServerTest : public testing::Test {
  protected:
    ControlServerTest() {
        kvlsim::loadChassis("boards:\n"
                            "  - {handle: 5, attributes: {SERIAL_NUMBER: \"S5\"}}\n");
        kvlsim::execute({{"command", "ping"}}); // starts the platform
    }

    static constexpr char const* kPing = R"({"command": "ping"})";
    static constexpr char const* kOk = R"({"ok":true})";

    static std::string padded(std::size_t length) {
        std::string line = kPing;
        line.resize(length, ' ');
        return line;
    }

    static void expectAlive() {
        Client other;
        EXPECT_EQ(other.ask(kPing).dump(), kOk);
    }
};

TEST_F(ControlServerTest, SocketIsForItsOwnerOnly) {
    struct stat file {};
    ASSERT_EQ(stat(socketPath().c_str(), &file), 0);
    EXPECT_TRUE(S_ISSOCK(file.st_mode));
    EXPECT_EQ(file.st_mode & 0777, 0600U);
}

TEST_F(ControlServerTest, CommandsOverTheSocketReachThePlatform) {
    Client client;
    EXPECT_EQ(client.ask(R"({"command": "stop", "board": 5})")["ok"], true);
    json const shown = kvlsim::execute({{"command", "show"}, {"board", 5}});
    EXPECT_EQ(shown["boards"][0]["attributes"]["BOARD_CONDITION"], 4);
}

TEST_F(ControlServerTest, EveryLineIsAnsweredInOrder) {
    Client client;
    client.send("{\"command\": \"ping\"}\n{\"command\": \"nonsense\"}\n{\"command\": \"ping\"}\n");
    EXPECT_EQ(client.line(), kOk);
    EXPECT_EQ(client.reply()["ok"], false);
    EXPECT_EQ(client.line(), kOk);
}

TEST_F(ControlServerTest, LineMayArriveInPieces) {
    Client client;
    client.send("{\"command\"");
    EXPECT_FALSE(client.readable(0));
    client.send(": \"ping\"}\r\n");
    EXPECT_EQ(client.line(), kOk);
}

TEST_F(ControlServerTest, EmptyLinesAreNotAnswered) {
    Client client;
    client.send("\n  \r\n");
    EXPECT_EQ(client.ask(kPing).dump(), kOk);
}

TEST_F(ControlServerTest, LastLineMayLackItsLineEnd) {
    Client client;
    client.send(kPing);
    client.endOfInput();
    EXPECT_EQ(client.line(), kOk);
    EXPECT_EQ(client.line(), "(closed)");
}

TEST_F(ControlServerTest, LineThatIsNotJsonIsRefusedAndTheConnectionGoesOn) {
    Client client;
    json const reply = client.ask("show");
    EXPECT_EQ(reply["ok"], false);
    EXPECT_EQ(reply["error"],
              "the line is not JSON; write one object a line, such as {\"command\": \"show\"}");
    EXPECT_EQ(client.ask(kPing).dump(), kOk);
}

TEST_F(ControlServerTest, LineThatIsNotUnicodeIsRefused) {
    Client client;
    EXPECT_EQ(client.ask("{\"command\": \"\xFF\xFE\"}")["ok"], false);
    EXPECT_EQ(client.ask(kPing).dump(), kOk);
}

TEST_F(ControlServerTest, LineThatIsNoObjectIsRefused) {
    Client client;
    EXPECT_THAT(client.ask("[1, 2]")["error"].get<std::string>(), HasSubstr("JSON object"));
}

TEST_F(ControlServerTest, DeeplyNestedLineIsRefused) {
    Client client;
    std::string const deep = std::string(2000000, '[') + std::string(2000000, ']');
    EXPECT_EQ(client.ask(deep)["ok"], false);
    EXPECT_EQ(client.ask(R"({"command": "set", "object": 5, "attribute": "X", "value": )" + deep +
                         "}")["error"],
              "too many nested levels; a chassis needs at most 12");
    EXPECT_EQ(client.ask(kPing).dump(), kOk);
}

TEST_F(ControlServerTest, LineOf8MiBIsAccepted) {
    Client client;
    EXPECT_EQ(client.ask(padded(8388608)).dump(), kOk);
}

TEST_F(ControlServerTest, LongerLineIsRefusedAndTheConnectionClosed) {
    Client client;
    EXPECT_EQ(client.ask(padded(8388609))["error"],
              "the line has more than 8388608 bytes; shorten it (this connection is closed)");
    EXPECT_EQ(client.line(), "(closed)");
    expectAlive();
}

TEST_F(ControlServerTest, EndlessLineIsRefusedBeforeItEnds) {
    Client client;
    client.send(std::string(20000000, 'x'));
    EXPECT_THAT(client.line(), HasSubstr("more than 8388608 bytes"));
    expectAlive();
}

TEST_F(ControlServerTest, ServerOutlivesAPollThatFails) {
    Client client;
    EXPECT_EQ(client.ask(kPing).dump(), kOk);
    rlimit before{};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &before), 0);
    StandardError standardError;
    // poll() refuses more descriptors than the process may have open.
    rlimit const one{1, before.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &one), 0);
    client.send(std::string(kPing) + "\n"); // wakes the server if it is polling already
    EXPECT_EQ(standardError.line(), "kvlsim: control socket " + socketPath() +
                                        ": poll fails (Invalid argument) and is tried again until "
                                        "it works\n");
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &before), 0);
    EXPECT_EQ(client.line(), kOk);
    expectAlive();
}

TEST_F(ControlServerTest, ClientThatNeverReadsHoldsUpNobody) {
    kvlsim::execute({{"command", "set"},
                     {"object", 5},
                     {"attribute", "DESCRIPTION"},
                     {"value", std::string(127, 'd')}});
    Client deaf;
    std::string shows;
    for (int i = 0; i < 100; ++i)
        shows += "{\"command\": \"show\"}\n";
    deaf.sendUntilFull(shows);
    expectAlive();
}

TEST_F(ControlServerTest, CommandOfAClientThatLeavesAtOnceIsExecuted) {
    Client hasty;
    hasty.send("{\"command\": \"drain\"}\n{\"command\": \"remove\", \"board\": 5}\n");
    hasty.close();
    Client other;
    // Bounded by the test's time limit: each request is answered, in the end with no board.
    while (!other.ask(R"({"command": "show"})")["boards"].empty()) {
    }
    expectAlive();
}

TEST_F(ControlServerTest, ClientsBeyondTheLimitAreToldSo) {
    std::list<Client> clients(64);
    for (auto& client : clients)
        EXPECT_EQ(client.ask(kPing).dump(), kOk);
    Client oneMore;
    EXPECT_EQ(oneMore.reply()["error"], "too many clients at once; close one and try again");
    EXPECT_EQ(oneMore.line(), "(closed)");
    EXPECT_EQ(clients.front().ask(kPing).dump(), kOk);
}

TEST_F(ControlServerTest, ClientsThatHaveGoneMakeRoomAtOnce) {
    for (int round = 0; round < 50; ++round) {
        {
            std::list<Client> clients(64);
            for (auto& client : clients)
                ASSERT_EQ(client.ask(kPing).dump(), kOk) << "round " << round;
        }
        expectAlive();
    }
}

/// A `Holder` is a handler that blocks the delivery thread until the test releases it.
class Holder final : public VqxEventService::CEventHandlerAdaptor {
  public:
    int HandleEvent(AdminCallbackMsg*, void*) override {
        inside.set_value();
        letGo.get_future().wait();
        return 1;
    }
    std::promise<void> inside;
    std::promise<void> letGo;
};

TEST_F(ControlServerTest, DrainWaitsForDeliveryAndHoldsUpNobodyElse) {
    Holder holder;
    VqxEventService::AdminConsumer::FilterCallbackAssoc filter{&holder, nullptr, 0x40001, 1};
    VqxEventService::VqxAdminConsumer consumer("ADMIN", L"Test", &filter, 1, nullptr, 0);
    consumer.Start();
    Client waiting;
    EXPECT_EQ(waiting.ask(R"({"command": "event", "id": "0x40001"})")["ok"], true);
    holder.inside.get_future().wait();
    Client leaving;
    leaving.send("{\"command\": \"drain\"}\n");
    leaving.close();
    waiting.send("{\"command\": \"drain\"}\n{\"command\": \"nonsense\"}\n");
    for (int i = 0; i < 10; ++i)
        expectAlive();
    EXPECT_FALSE(waiting.readable(0));
    holder.letGo.set_value();
    EXPECT_EQ(waiting.line(), kOk);
    EXPECT_EQ(waiting.reply()["ok"], false);
}

} // namespace
