// SPDX-License-Identifier: BSD-2-Clause
// Lines and links that change, as a notification receiver prints them.
#include <cstdio>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;

/// Notifications of the line with ifIndex 1000, which is device 101, and of its link.
constexpr char kLineTraps[] = "1.3.6.1.2.1.10.18.6.1.17.1000";
constexpr char kLinkTraps[] = "1.3.6.1.2.1.31.1.1.1.14.1000";

/// The status of a cut line: no signal, no frame, RAI sent to the far end, unavailable.
constexpr char kCut[] = "8292";
constexpr char kWhole[] = "1";

constexpr char kAnyLine[] = "transmission.18.15.0.1";
constexpr char kAnyLinkDown[] = "snmpModules.1.1.5.3";

class LineNotificationTest : public AgentFixture {
  protected:
    /// Starts receiver and agent, with notifications of version 3.
    void startWithUser() {
        startTrapReceiver("createUser -e 0x8000000001020304 op SHA authpass1 AES privpass1\n"
                          "authUser log op priv\n");
        configureSnmp("exactEngineID 0x8000000001020304\n"
                      "rwcommunity public 127.0.0.1\n"
                      "createUser op SHA authpass1 AES privpass1\n"
                      "trapsess -v 3 -u op -l authPriv -a SHA -A authpass1 -x AES -X privpass1 " +
                      trapAddress() + "\n");
        startAgent();
    }
    void set(std::string const& name, std::string const& value) const {
        Result const result = ask("snmpset", {name, "i", value});
        EXPECT_EQ(result.status, 0) << result.output;
    }
    void cut() const { sim({"line", "alarm", "101", "los"}); }
    void mend() const { sim({"line", "mend", "101"}); }

    void expectTold(std::string const& text) {
        EXPECT_TRUE(trapReceiver().waitFor(text)) << text << " not in:\n"
                                                  << trapReceiver().output();
    }
    void expectLineTold(std::string const& status) {
        expectTold(
            "1.1.4.1.0 = SNMPv2-SMI::transmission.18.15.0.1\tSNMPv2-SMI::transmission.18.6.1.10."
            "1000 = " +
            status + "\tSNMPv2-SMI::transmission.18.6.1.16.1000 = ");
    }
    /// `number`: 3 for linkDown, 4 for linkUp.
    void expectLinkTold(int number, std::string const& index, int operStatus) {
        expectTold("1.1.4.1.0 = SNMPv2-SMI::snmpModules.1.1.5." + std::to_string(number) +
                   "\tSNMPv2-SMI::mib-2.2.2.1.1." + index + " = " + index +
                   "\tSNMPv2-SMI::mib-2.2.2.1.7." + index + " = 1\tSNMPv2-SMI::mib-2.2.2.1.8." +
                   index + " = " + std::to_string(operStatus));
    }
    /// The ifIndex of the interface of that name.
    std::string indexOf(std::string const& name) const {
        for (Answer const& answer : walk("1.3.6.1.2.1.31.1.1.1.1"))
            if (answer.value == "STRING: \"" + name + "\"")
                return std::to_string(answer.name.back());
        return "none";
    }
};

TEST_F(LineNotificationTest, LineForWhichItIsEnabledIsToldCutAndWhole) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    cut();
    expectLineTold(kCut);
    mend();
    expectLineTold(kWhole);
}

TEST_F(LineNotificationTest, LineAndLinkSayWhoTheyAreWithWhatAGetAnswers) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    std::string const alias = "1.3.6.1.2.1.31.1.1.1.18.1000";
    EXPECT_EQ(ask("snmpset", {alias, "s", "to the exchange"}).status, 0);
    cut();
    expectLinkTold(3, "1000", 2);
    expectLineTold(kCut);
    std::string const who = "\tSNMPv2-SMI::mib-2.31.1.1.1.1.1000 = \"nx5-trunk-1\""
                            "\tSNMPv2-SMI::mib-2.31.1.1.1.18.1000 = \"to the exchange\""
                            "\tKVL-OAM-MIB::kvlBoardSerialNumber.1 = NX50001";
    EXPECT_TRUE(trapReceiver().waitFor(who, 2)) << trapReceiver().output();
    // They follow the objects of the standard.
    expectTold("\tSNMPv2-SMI::mib-2.2.2.1.8.1000 = 2" + who);
    EXPECT_EQ(get("1.3.6.1.2.1.31.1.1.1.1.1000"), "STRING: \"nx5-trunk-1\"");
    EXPECT_EQ(get(alias), "STRING: \"to the exchange\"");
    EXPECT_EQ(get("kvlBoardSerialNumber.1"), "STRING: NX50001");
}

TEST_F(LineNotificationTest, ThirdVersionCarriesLinesAndLinks) {
    startWithUser();
    set(kLineTraps, "1");
    cut();
    expectLineTold(kCut);
    expectLinkTold(3, "1000", 2);
}

TEST_F(LineNotificationTest, LineForWhichItIsNotEnabledIsNotTold) {
    startWithReceiver("rwcommunity");
    cut();
    expectLinkTold(3, "1000", 2);
    mend();
    // A notification of the line would have arrived before this one.
    expectLinkTold(4, "1000", 1);
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kAnyLine)));
}

TEST_F(LineNotificationTest, LineForWhichItIsDisabledAgainIsNotTold) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    cut();
    expectLineTold(kCut);
    set(kLineTraps, "2");
    mend();
    expectLinkTold(4, "1000", 1);
    EXPECT_EQ(trapReceiver().output().find(kAnyLine), trapReceiver().output().rfind(kAnyLine));
}

TEST_F(LineNotificationTest, LinkIsToldDownAndUp) {
    startWithReceiver("rwcommunity");
    cut();
    expectLinkTold(3, "1000", 2);
    mend();
    expectLinkTold(4, "1000", 1);
}

TEST_F(LineNotificationTest, LinkIsToldWithTheTimeOfTheFirstUnavailableSecond) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    // What began before the agent is at 0.
    ASSERT_TRUE(eventually([this] {
        int hundredths = 0;
        std::sscanf(get("1.3.6.1.2.1.1.3.0").c_str(), "Timeticks: (%d)", &hundredths);
        return hundredths > 500;
    }));
    cut();
    expectLineTold(kCut);
    expectLinkTold(3, "1000", 2);
    // The signal was lost at least two seconds before this was a failure.
    std::string const output = trapReceiver().output();
    auto const hundredths = [&](std::size_t before) {
        std::size_t const at = output.rfind("mib-2.1.3.0 = 0:0:", before);
        int minutes = 0;
        double seconds = 0;
        EXPECT_EQ(std::sscanf(output.c_str() + at, "mib-2.1.3.0 = 0:0:%d:%lf", &minutes, &seconds),
                  2);
        return static_cast<long>((minutes * 60 + seconds) * 100 + 0.5);
    };
    long const link = hundredths(output.find(kAnyLinkDown));
    long const line = hundredths(output.find(kAnyLine));
    EXPECT_GE(line - link, 100);
    std::string const lastChange = get("1.3.6.1.2.1.2.2.1.9.1000");
    EXPECT_THAT(lastChange, HasSubstr("(" + std::to_string(link) + ")"));
}

TEST_F(LineNotificationTest, LinkForWhichItIsDisabledIsNotTold) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    set(kLinkTraps, "2");
    cut();
    expectLineTold(kCut);
    mend();
    expectLineTold(kWhole);
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kAnyLinkDown)));
}

TEST_F(LineNotificationTest, ChannelIsToldWhenItIsEnabled) {
    startWithReceiver("rwcommunity");
    std::string const channel = indexOf("D1");
    ASSERT_NE(channel, "none");
    sim({"call", "signalling", "301", "l2"});
    std::string const state = "1.3.6.1.2.1.2.2.1.8." + channel;
    ASSERT_TRUE(eventually([&] { return get(state) == "INTEGER: 1"; }));
    set("1.3.6.1.2.1.31.1.1.1.14." + channel, "1");
    // A signalling channel that is not activated waits, which is not down.
    sim({"call", "signalling", "301", "l1"});
    ASSERT_TRUE(eventually([&] { return get(state) == "INTEGER: 5"; }));
    sim({"line", "alarm", "301", "los"});
    expectLinkTold(3, channel, 7);
    EXPECT_EQ(get(state), "INTEGER: 7");
    sim({"line", "mend", "301"});
    expectLinkTold(4, channel, 5);
}

TEST_F(LineNotificationTest, TablesShowTheChangeWhenItsNotificationArrives) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    cut();
    expectLineTold(kCut);
    EXPECT_EQ(get("1.3.6.1.2.1.10.18.6.1.10.1000"), "INTEGER: 8292");
    EXPECT_EQ(get("1.3.6.1.2.1.2.2.1.8.1000"), "INTEGER: 2");
}

TEST_F(LineNotificationTest, LineIsToldAfterARestartToo) {
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    startAgent();
    cut();
    expectLineTold(kCut);
}

TEST_F(LineNotificationTest, LineOfABoardThatHasComeBackIsToldAndItsComingIsNot) {
    useChassis("boards:\n"
               "  - handle: 1\n"
               "    attributes: {SERIAL_NUMBER: ONE}\n"
               "    devices: [{handle: 101, type: 501, attributes: {NAME: trunk}, "
               "line: {type: esf}}]\n");
    startWithReceiver("rwcommunity");
    set(kLineTraps, "1");
    sim({"remove", "1"});
    ASSERT_TRUE(eventually([&] { return get(kLineTraps).starts_with("No Such"); }));
    sim({"insert", path("chassis.yaml")});
    ASSERT_TRUE(eventually([&] { return get(kLineTraps) == "INTEGER: 1"; }));
    EXPECT_THAT(trapReceiver().output(), Not(HasSubstr(kAnyLinkDown)));
    cut();
    expectLineTold(kCut);
    expectLinkTold(3, "1000", 2);
}

} // namespace
} // namespace kvloamd::e2e
