// SPDX-License-Identifier: BSD-2-Clause
// The agent ends cleanly whatever it is doing. Sanitizers report through its exit status.
#include <fcntl.h>

#include <atomic>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <thread>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class StopTest : public AgentFixture {};

TEST_F(StopTest, TerminationEndsTheAgentWithBoardsPresent) {
    startAgent();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(agent().output(), HasSubstr("kvloamd: stopped"));
}

TEST_F(StopTest, InterruptEndsTheAgentToo) {
    startAgent();
    agent().signal(SIGINT);
    EXPECT_EQ(agent().wait(), 0) << agent().output();
}

TEST_F(StopTest, TerminationDuringAWalkEndsTheAgent) {
    Result const chassis = run({KVLSIM, "generate", "--boards", "500"});
    useChassis(chassis.output);
    startAgent();
    Process walking(
        {"snmpwalk", "-v2c", "-c", "public", "-t", "1", "-r", "0", "-On", address(), kObjects},
        environment());
    ASSERT_TRUE(walking.waitFor(" = "));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_NE(walking.wait(), 0);
}

TEST_F(StopTest, TerminationWhileBoardsComeAndGoEndsTheAgent) {
    startAgent();
    std::atomic<bool> stopping{false};
    std::thread operating([&] {
        // Commands fail once the agent has ended, because the platform ends with it.
        for (int round = 0; !stopping; ++round) {
            run({KVLSIM, "insert", "--handle", "50", "--serial", "C" + std::to_string(round)});
            run({KVLSIM, "remove", "50"});
        }
    });
    EXPECT_TRUE(
        eventually([this] { return get("kvlBoardStatusChanges.0") != "Counter32: 0 changes"; }));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    stopping = true;
    operating.join();
}

/// A module that never returns keeps the agent from starting.
class StopDuringStartTest : public AgentFixture {
  protected:
    void launchHangingAgent() {
        launchAgent({"--port", std::to_string(freePort()), "--module", "hanging", "--module-dir",
                     BROKEN_MODULE_DIR, "--snmp-config", path("snmp.conf"), "--persistent-dir",
                     path("persistent")});
        ASSERT_TRUE(agent().waitFor("the module hangs")) << agent().output();
    }
};

TEST_F(StopDuringStartTest, TerminationEndsAStartThatHangs) {
    launchHangingAgent();
    agent().signal(SIGTERM);
    EXPECT_EQ(agent().wait(), 128 + SIGTERM);
    EXPECT_THAT(agent().output(), HasSubstr("kvloamd: stopped during the start"));
}

TEST_F(StopDuringStartTest, InterruptEndsAStartThatHangs) {
    launchHangingAgent();
    agent().signal(SIGINT);
    EXPECT_GE(agent().wait(), 128);
}

TEST_F(StopDuringStartTest, HangUpDoesNotEndTheStart) {
    launchHangingAgent();
    agent().signal(SIGHUP);
    agent().signal(SIGTERM);
    EXPECT_EQ(agent().wait(), 128 + SIGTERM);
}

TEST_F(StopTest, AddressesAreNotInheritedByOtherPrograms) {
    startAgent();
    std::string const process = "/proc/" + std::to_string(agent().pid());
    int sockets = 0;
    for (auto const& file : std::filesystem::directory_iterator(process + "/fd")) {
        std::error_code error;
        if (!read_symlink(file, error).string().starts_with("socket:")) continue;
        std::ifstream info(process + "/fdinfo/" + file.path().filename().string());
        std::string word;
        while (info >> word && word != "flags:") {
        }
        info >> word;
        EXPECT_TRUE(std::stoul(word, nullptr, 8) & O_CLOEXEC) << file << ' ' << word;
        ++sockets;
    }
    EXPECT_GT(sockets, 0);
}

TEST_F(StopTest, AgentStartsAgainOnTheSamePortAfterwards) {
    startAgent();
    std::string const port = address().substr(address().find(':') + 1);
    ASSERT_EQ(stopAgent(), 0);
    Process again({KVLOAMD, "--port", port, "--module", "z7sim", "--module-dir", moduleDirectory(),
                   "--snmp-config", path("snmp.conf"), "--persistent-dir", path("persistent")},
                  environment());
    EXPECT_TRUE(again.waitFor("serving 3 boards")) << again.output();
}

} // namespace
} // namespace kvloamd::e2e
