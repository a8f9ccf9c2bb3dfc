// SPDX-License-Identifier: BSD-2-Clause
// The agent under a service manager, which the test simulates.
#include <poll.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <csignal>
#include <stdexcept>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

/// The notification socket of a service manager.
class NoticeSocket {
  public:
    explicit NoticeSocket(std::string const& path)
        : m_socket(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        path.copy(address.sun_path, sizeof address.sun_path - 1);
        if (bind(m_socket, reinterpret_cast<sockaddr*>(&address), sizeof address) != 0)
            throw std::runtime_error("no socket at " + path);
    }
    ~NoticeSocket() { close(m_socket); }
    NoticeSocket(NoticeSocket const&) = delete;
    NoticeSocket& operator=(NoticeSocket const&) = delete;

    /// Waits for a message that contains this line.
    bool hears(std::string const& line) const {
        auto const deadline = std::chrono::steady_clock::now() + kPatience;
        while (std::chrono::steady_clock::now() < deadline) {
            pollfd readable{m_socket, POLLIN, 0};
            char buffer[1024];
            if (poll(&readable, 1, 1000) <= 0) continue;
            ssize_t const got = recv(m_socket, buffer, sizeof buffer, 0);
            if (got <= 0) return false;
            for (std::string const& told : linesOf({buffer, static_cast<std::size_t>(got)}))
                if (told == line) return true;
        }
        return false;
    }

  private:
    int m_socket;
};

class ServiceTest : public AgentFixture {
  protected:
    ServiceTest() { setVariable("NOTIFY_SOCKET", path("notify.sock")); }

    /// Starts the agent with a configuration file, and waits until it is ready.
    void startConfigured(std::string const& text) {
        write(path("kvloamd.toml"), text);
        startAgent({"--config", path("kvloamd.toml")});
        ASSERT_TRUE(m_manager.hears("READY=1"));
    }
    /// Replaces the configuration, reloads the agent, and waits until it has read it.
    void reload(std::string const& text) {
        write(path("kvloamd.toml"), text);
        agent().signal(SIGHUP);
        ASSERT_TRUE(m_manager.hears("RELOADING=1"));
        ASSERT_TRUE(m_manager.hears("READY=1"));
    }

    NoticeSocket m_manager{path("notify.sock")};
};

TEST_F(ServiceTest, ReadinessIsToldOnceTheAgentServes) {
    startAgent();
    EXPECT_TRUE(m_manager.hears("READY=1"));
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(ServiceTest, StopIsTold) {
    startAgent();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_TRUE(m_manager.hears("STOPPING=1"));
}

TEST_F(ServiceTest, WatchdogHearsAgainAndAgainThatTheAgentLives) {
    setVariable("WATCHDOG_USEC", "200000");
    startAgent();
    for (int beat = 0; beat < 3; ++beat)
        EXPECT_TRUE(m_manager.hears("WATCHDOG=1"));
}

TEST_F(ServiceTest, HangupChangesTheLogLevel) {
    startConfigured("log-level=\"info\"\n");
    reload("log-level=\"error\"\n");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(agent().output(), Not(HasSubstr("kvloamd: stopped")));
}

TEST_F(ServiceTest, HangupKeepsBoardsAndCounts) {
    startConfigured("log-level=\"info\"\n");
    sim({"stop", "1"});
    ASSERT_TRUE(
        eventually([this] { return get("kvlBoardStatusChanges.0") == "Counter32: 1 changes"; }));
    reload("log-level=\"info\"\n");
    ASSERT_TRUE(agent().waitFor("kvloamd: the configuration has been read again\n"));
    EXPECT_EQ(get("kvlBoardStatusChanges.0"), "Counter32: 1 changes");
}

TEST_F(ServiceTest, ChangeThatNeedsAStartSaysSo) {
    startConfigured("log-level=\"info\"\n");
    reload("enterprise-oid=\"1.3.6.1.4.1.99999\"\n");
    EXPECT_TRUE(agent().waitFor("take effect at the next start")) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(ServiceTest, BadFileIsReportedInOneLineAndTheAgentGoesOn) {
    startConfigured("log-level=\"info\"\n");
    reload("prot=1161\n");
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    int lines = 0;
    for (std::string const& line : linesOf(agent().output()))
        if (line.find("prot") != std::string::npos) {
            ++lines;
            EXPECT_THAT(line, HasSubstr("keeping the previous configuration"));
        }
    EXPECT_EQ(lines, 1) << agent().output();
}

} // namespace
} // namespace kvloamd::e2e
