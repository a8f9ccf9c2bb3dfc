// SPDX-License-Identifier: BSD-2-Clause
// Masters that are late, go away, return or hang: the agent continues and logs each change once.
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;

class MasterAwayTest : public MasterFixture {
  protected:
    /// Master and agent, with a receiver of the master's notifications.
    void start() {
        startTrapReceiver("authCommunity log public\n");
        configureMaster("trap2sink " + trapAddress() + " public\n");
        startMaster();
        startSubagent();
        ASSERT_TRUE(isConnected()) << agent().output();
    }
    static std::string announced(std::string const& serialNumber, std::string const& status) {
        return "\tKVL-OAM-MIB::kvlNotifyBoardSerialNumber.0 = " + serialNumber +
               "\tKVL-OAM-MIB::kvlNotifyBoardStatus.0 = " + status;
    }
    void expectAnnounced(std::string const& serialNumber, std::string const& status) {
        EXPECT_TRUE(trapReceiver().waitFor(announced(serialNumber, status)))
            << trapReceiver().output();
    }
};

TEST_F(MasterAwayTest, AgentStartedFirstServesOnceTheMasterIsThere) {
    startSubagent();
    ASSERT_TRUE(agent().waitFor("kvloamd: no connection to the SNMP master at"))
        << agent().output();
    startMaster();
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_THAT(statesTold(), ElementsAre("none", "connected"));
}

TEST_F(MasterAwayTest, NotificationGoesThroughTheMaster) {
    start();
    sim({"remove", "2"});
    expectAnnounced("QL-77-0420", "removed");
    EXPECT_EQ(count(trapReceiver().output(), "kvlBoardStatusChange"), 1);
}

TEST_F(MasterAwayTest, LineThatIsCutIsToldThroughTheMaster) {
    startTrapReceiver("authCommunity log public\n");
    configureMaster("rwcommunity private 127.0.0.1\ntrap2sink " + trapAddress() + " public\n");
    startMaster();
    startSubagent();
    ASSERT_TRUE(isConnected()) << agent().output();
    Result const set = snmp("snmpset", {"-v2c", "-c", "private", "-t", "30", address(),
                                        "1.3.6.1.2.1.10.18.6.1.17.1000", "i", "1"});
    ASSERT_EQ(set.status, 0) << set.output;
    sim({"line", "alarm", "101", "los"});
    EXPECT_TRUE(
        trapReceiver().waitFor("1.1.4.1.0 = SNMPv2-SMI::transmission.18.15.0.1\tSNMPv2-SMI::"
                               "transmission.18.6.1.10.1000 = 8292\t"))
        << trapReceiver().output();
    EXPECT_TRUE(trapReceiver().waitFor("1.1.4.1.0 = SNMPv2-SMI::snmpModules.1.1.5.3\tSNMPv2-SMI::"
                                       "mib-2.2.2.1.1.1000 = 1000\t"))
        << trapReceiver().output();
}

TEST_F(MasterAwayTest, TableShowsTheChangeWhenItsNotificationArrives) {
    start();
    sim({"stop", "1"});
    expectAnnounced("NX50001", "stopped");
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: stopped(4)");
}

TEST_F(MasterAwayTest, MasterThatIsKilledAndComesBackServesAgain) {
    start();
    killMaster();
    ASSERT_TRUE(isLost()) << agent().output();
    startMaster();
    ASSERT_TRUE(isConnected(2)) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(statesTold(), ElementsAre("connected", "lost", "connected"));
}

TEST_F(MasterAwayTest, LossesOfTheMasterAreCounted) {
    start();
    EXPECT_EQ(get("kvlAgentFront.0"), "INTEGER: subagent(2)");
    EXPECT_EQ(get("kvlMasterState.0"), "INTEGER: connected(1)");
    EXPECT_EQ(get("kvlMasterLosses.0"), "Counter32: 0 times");
    killMaster();
    ASSERT_TRUE(isLost()) << agent().output();
    startMaster();
    ASSERT_TRUE(isConnected(2)) << agent().output();
    EXPECT_EQ(get("kvlMasterLosses.0"), "Counter32: 1 times");
}

TEST_F(MasterAwayTest, FaultIsAnnouncedThroughTheMaster) {
    start();
    sim({"fault", "2", "17"});
    EXPECT_TRUE(trapReceiver().waitFor("\tKVL-OAM-MIB::kvlNotifyFaultValue.0 = 17\t"))
        << trapReceiver().output();
    EXPECT_EQ(get("kvlFaultTimesRaised.2.17"), "Counter32: 1 times");
}

TEST_F(MasterAwayTest, MasterThatRestartsFiveTimesQuicklyServesInTheEnd) {
    start();
    for (int round = 0; round < 5; ++round) {
        killMaster();
        startMaster();
    }
    EXPECT_TRUE(eventually([this] { return get("kvlBoardCount.0") == "Gauge32: 3 boards"; }))
        << agent().output();
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    auto const states = statesTold();
    ASSERT_GE(states.size(), 3U);
    for (std::size_t i = 0; i < states.size(); ++i)
        EXPECT_EQ(states[i], i % 2 == 0 ? "connected" : "lost") << agent().output();
    EXPECT_EQ(states.back(), "connected");
}

TEST_F(MasterAwayTest, MasterThatHangsServesAgainWhenItGoesOn) {
    start();
    master().signal(SIGSTOP);
    // The master does not acknowledge the notification.
    sim({"stop", "1"});
    ASSERT_TRUE(isLost()) << agent().output();
    EXPECT_THAT(agent().output(), HasSubstr("it does not answer"));
    sim({"remove", "2"});
    master().signal(SIGCONT);
    ASSERT_TRUE(isConnected(2)) << agent().output();
    expectAnnounced("NX50001", "stopped");
    expectAnnounced("QL-77-0420", "removed");
    EXPECT_EQ(count(trapReceiver().output(), "kvlBoardStatusChange"), 2);
    EXPECT_EQ(get("kvlBoardStatus.1"), "INTEGER: stopped(4)");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(statesTold(), ElementsAre("connected", "lost", "connected"));
}

TEST_F(MasterAwayTest, MasterThatHangsAtTheStartServesWhenItGoesOn) {
    startMaster();
    master().signal(SIGSTOP);
    startSubagent();
    ASSERT_TRUE(agent().waitFor("kvloamd: no connection to the SNMP master at"))
        << agent().output();
    master().signal(SIGCONT);
    ASSERT_TRUE(isConnected()) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_THAT(statesTold(), ElementsAre("none", "connected"));
}

TEST_F(MasterAwayTest, NotificationsOfTheTimeWithoutAMasterArriveInOrderOnceItIsBack) {
    start();
    killMaster();
    ASSERT_TRUE(isLost()) << agent().output();
    sim({"stop", "1"});
    sim({"start", "1"});
    sim({"remove", "2"});
    startMaster();
    expectAnnounced("NX50001", "stopped");
    expectAnnounced("NX50001", "started");
    expectAnnounced("QL-77-0420", "removed");
    auto const& output = trapReceiver().output();
    EXPECT_LT(output.find(announced("NX50001", "stopped")),
              output.find(announced("NX50001", "started")));
    EXPECT_LT(output.find(announced("NX50001", "started")),
              output.find(announced("QL-77-0420", "removed")));
    EXPECT_EQ(count(output, "kvlBoardStatusChange"), 3);
    EXPECT_EQ(get("kvlNotificationsDropped.0"), "Counter32: 0 notifications");
}

TEST_F(MasterAwayTest, NotificationThatAHangingMasterDiesWithArrivesThroughTheNext) {
    start();
    master().signal(SIGSTOP);
    sim({"remove", "2"});
    ASSERT_TRUE(isLost()) << agent().output();
    killMaster();
    startMaster();
    expectAnnounced("QL-77-0420", "removed");
}

TEST_F(MasterAwayTest, StopIsNotHeldUpByAMasterThatHangs) {
    start();
    master().signal(SIGSTOP);
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(agent().output(), HasSubstr("kvloamd: stopped"));
}

TEST_F(MasterAwayTest, StopWithoutAMasterSaysWhatCouldNotBeSent) {
    startSubagent();
    ASSERT_TRUE(agent().waitFor("kvloamd: no connection to the SNMP master at"))
        << agent().output();
    sim({"remove", "2"});
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    // One for the board, and perhaps one for the physical entities.
    EXPECT_THAT(agent().output(),
                ::testing::ContainsRegex("notifications not sent before the stop: [1-9]"));
}

} // namespace
} // namespace kvloamd::e2e
