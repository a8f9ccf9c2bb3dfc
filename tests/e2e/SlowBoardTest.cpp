// SPDX-License-Identifier: BSD-2-Clause
// A board that never answers delays no request, and the stop only for a limited time.
#include <csignal>
#include <filesystem>
#include <fstream>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class SlowBoardTest : public AgentFixture {
  protected:
    /// Starts an agent, lets its board hang, and waits until it does.
    void startWithHangingBoard() {
        auto variables = environment();
        variables["SLOW_BOARD_ORDER"] = path("order");
        variables["SLOW_BOARD_MARK"] = path("mark");
        m_place = "127.0.0.1:" + std::to_string(freePort());
        m_agent = std::make_unique<Process>(
            std::vector<std::string>{KVLOAMD, "--listen", "udp:" + m_place, "--module", "slow",
                                     "--module-dir", BROKEN_MODULE_DIR, "--snmp-config",
                                     path("snmp.conf"), "--persistent-dir", path("persistent")},
            variables);
        ASSERT_TRUE(m_agent->waitFor("serving 1 board ")) << m_agent->output();
        std::ofstream(path("order")) << "hang\n";
        // Requests make the agent refresh its snapshot.
        ASSERT_TRUE(eventually([this] {
            askForName();
            return std::filesystem::exists(path("mark"));
        }));
    }
    std::string askForName() {
        return snmp("snmpget",
                    {"-v2c", "-c", "public", "-t", "30", "-r", "0", m_place, "kvlBoardName.1"})
            .output;
    }

    std::string m_place;
    std::unique_ptr<Process> m_agent;
};

TEST_F(SlowBoardTest, RequestsAreAnsweredWhileTheBoardHangs) {
    startWithHangingBoard();
    for (int request = 0; request < 5; ++request)
        EXPECT_THAT(askForName(), HasSubstr("STRING: text name"));
}

TEST_F(SlowBoardTest, SecondSignalEndsAStopThatTheBoardHoldsUp) {
    startWithHangingBoard();
    m_agent->signal(SIGTERM);
    ASSERT_TRUE(m_agent->waitFor("kvloamd: stopping"));
    m_agent->signal(SIGTERM);
    EXPECT_EQ(m_agent->wait(), 128 + SIGTERM);
}

} // namespace
} // namespace kvloamd::e2e
