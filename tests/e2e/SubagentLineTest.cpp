// SPDX-License-Identifier: BSD-2-Clause
// Lines and links that change, announced through a master.
#include "tests/e2e/MasterFixture.h"

namespace kvloamd::e2e {
namespace {

constexpr char kLineTraps[] = "1.3.6.1.2.1.10.18.6.1.17.1000";

class SubagentLineTest : public MasterFixture {
  protected:
    void start() {
        startTrapReceiver("authCommunity log public\n");
        configureMaster("rwcommunity private 127.0.0.1\ntrap2sink " + trapAddress() + " public\n");
        startMaster();
        startSubagent();
        ASSERT_TRUE(isConnected()) << agent().output();
        Result const set =
            snmp("snmpset", {"-v2c", "-c", "private", address(), kLineTraps, "i", "1"});
        EXPECT_EQ(set.status, 0) << set.output;
    }
    void expectTold(std::string const& text) {
        EXPECT_TRUE(trapReceiver().waitFor(text)) << text << " not in:\n"
                                                  << trapReceiver().output();
    }
    /// Notifications of a cut line with ifIndex 1000, and of its link.
    void expectCutTold() {
        expectTold(
            "1.1.4.1.0 = SNMPv2-SMI::transmission.18.15.0.1\tSNMPv2-SMI::transmission.18.6.1.10."
            "1000 = 8292\tSNMPv2-SMI::transmission.18.6.1.16.1000 = ");
        expectTold("1.1.4.1.0 = SNMPv2-SMI::snmpModules.1.1.5.3\tSNMPv2-SMI::mib-2.2.2.1.1.1000 = "
                   "1000\tSNMPv2-SMI::mib-2.2.2.1.7.1000 = 1\tSNMPv2-SMI::mib-2.2.2.1.8.1000 = 2");
    }
};

TEST_F(SubagentLineTest, CutLineAndItsLinkAreTold) {
    start();
    sim({"line", "alarm", "101", "los"});
    expectCutTold();
}

TEST_F(SubagentLineTest, NotificationsAreInTheMastersLogWithTheirNumbers) {
    start();
    sim({"line", "alarm", "101", "los"});
    expectCutTold();
    bool isLogged = false;                                        // kvlEventNumber.0
    for (Answer const& answer : walk("1.3.6.1.2.1.92.1.3.2.1.2")) // nlmLogVariableID
        isLogged = isLogged || answer.value == "OID: .1.3.6.1.4.1.32473.1.1.12.5.0";
    EXPECT_TRUE(isLogged);
}

TEST_F(SubagentLineTest, WhatHappensWhileTheMasterIsAwayIsToldWhenItIsBack) {
    start();
    killMaster();
    ASSERT_TRUE(isLost()) << agent().output();
    sim({"line", "alarm", "101", "los"});
    startMaster();
    expectCutTold();
}

} // namespace
} // namespace kvloamd::e2e
