// SPDX-License-Identifier: BSD-2-Clause
// SIGHUP makes the agent read its SNMP configuration again.
#include <csignal>
#include <cstdio>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::AllOf;
using ::testing::HasSubstr;
using ::testing::Not;

constexpr char kReadAgain[] =
    "kvloamd: the SNMP configuration (communities, users, views, receivers) has been read again\n";

class ReloadTest : public AgentFixture {
  protected:
    void startWith(std::string const& config) {
        configureSnmp(config);
        startAgent();
    }
    /// Replaces the configuration and waits until the agent has read it.
    void reload(std::string const& config) {
        configureSnmp(config);
        agent().signal(SIGHUP);
        ASSERT_TRUE(agent().waitFor(kReadAgain, ++m_reloads)) << agent().output();
    }
    /// The status of a snmpget, which tries once.
    Result getAs(std::vector<std::string> who, std::string const& name) const {
        for (std::string const& option : {std::string("-r"), std::string("0"), std::string("-t"),
                                          std::string("5"), address(), name})
            who.push_back(option);
        return snmp("snmpget", who);
    }
    Result getAs(std::string const& community, std::string const& name) const {
        return getAs(std::vector<std::string>{"-v2c", "-c", community}, name);
    }

    int m_reloads = 0;
};

TEST_F(ReloadTest, CommunitiesAreAddedAndRemoved) {
    startWith(kReader + std::string("rocommunity old 127.0.0.1\n"));
    EXPECT_EQ(getAs("old", "kvlBoardCount.0").status, 0);
    reload(kReader + std::string("rocommunity new 127.0.0.1\n"));
    EXPECT_EQ(getAs("new", "kvlBoardCount.0").status, 0);
    EXPECT_NE(getAs("old", "kvlBoardCount.0").status, 0);
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(ReloadTest, ViewIsReplaced) {
    std::string const community = "rocommunity public 127.0.0.1 -V mine\n";
    startWith(community + "view mine included .1.3.6.1.4.1.32473.1.1.2\n");
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_THAT(get("1.3.6.1.2.1.1.3.0"), HasSubstr("No Such"));
    reload(community + "view mine included .1.3.6.1.2.1.1\n");
    EXPECT_THAT(get("kvlBoardCount.0"), HasSubstr("No Such"));
    EXPECT_THAT(get("1.3.6.1.2.1.1.3.0"), HasSubstr("Timeticks"));
}

TEST_F(ReloadTest, UserIsAddedAndItsAccessRemoved) {
    startWith(kReader);
    std::vector<std::string> const operation{"-v3", "-u",  "op",       "-l",        "authPriv",
                                             "-a",  "SHA", "-A",       "authpass1", "-x",
                                             "AES", "-X",  "privpass1"};
    std::string const user = "createUser op SHA authpass1 AES privpass1\n";
    EXPECT_NE(getAs(operation, "kvlBoardCount.0").status, 0);
    reload(kReader + user + "rouser op priv\n");
    EXPECT_EQ(getAs(operation, "kvlBoardCount.0").status, 0);
    reload(kReader + user);
    EXPECT_NE(getAs(operation, "kvlBoardCount.0").status, 0);
}

TEST_F(ReloadTest, PasswordIsReplaced) {
    auto const config = [](std::string const& password) {
        return kReader + ("createUser op SHA " + password + "\nrouser op auth\n");
    };
    auto const statusWith = [this](std::string const& password) {
        return getAs({"-v3", "-u", "op", "-l", "authNoPriv", "-a", "SHA", "-A", password},
                     "kvlBoardCount.0")
            .status;
    };
    startWith(config("firstpass"));
    EXPECT_EQ(statusWith("firstpass"), 0);
    reload(config("secondpass"));
    EXPECT_EQ(statusWith("secondpass"), 0);
    EXPECT_NE(statusWith("firstpass"), 0);
}

TEST_F(ReloadTest, ReceiverIsAdded) {
    startTrapReceiver("authCommunity log public\n");
    startWith(kReader);
    reload(kReader + ("trap2sink " + trapAddress() + " public\n"));
    sim({"stop", "1"});
    EXPECT_TRUE(trapReceiver().waitFor("kvlNotifyBoardStatus.0 = stopped"))
        << trapReceiver().output();
}

TEST_F(ReloadTest, ReceiverIsSentEachNotificationOnceAfterManyReloads) {
    startTrapReceiver("authCommunity log public\n");
    std::string const config = kReader + ("trap2sink " + trapAddress() + " public\n");
    startWith(config);
    for (int round = 0; round < 3; ++round)
        reload(config);
    sim({"stop", "1"});
    sim({"start", "1"});
    ASSERT_TRUE(trapReceiver().waitFor("kvlNotifyBoardStatus.0 = started"));
    std::string const& output = trapReceiver().output();
    auto const first = output.find("kvlNotifyBoardStatus.0 = stopped");
    ASSERT_NE(first, std::string::npos) << output;
    EXPECT_EQ(output.find("kvlNotifyBoardStatus.0 = stopped", first + 1), std::string::npos);
}

TEST_F(ReloadTest, ReceiverThatDidNotResolveIsForgotten) {
    startWith(kReader + std::string("trap2sink a.invalid public\n"));
    ASSERT_TRUE(agent().waitFor("a.invalid cannot be opened"));
    reload(kReader);
    sim({"fault", "2", "17"});
    EXPECT_TRUE(eventually(
        [this] { return get("kvlNotificationsSent.0") == "Counter32: 1 notifications"; }));
}

TEST_F(ReloadTest, BrokenFileChangesNothingAndIsReportedInOneLine) {
    startWith(kReader);
    configureSnmp("rocommunity other 127.0.0.1\nrouserr op\nrocommunityy public\n");
    agent().signal(SIGHUP);
    ASSERT_TRUE(agent().waitFor("keeping the previous SNMP configuration")) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
    EXPECT_NE(getAs("other", "kvlBoardCount.0").status, 0);
    EXPECT_EQ(stopAgent(), 0);
    int lines = 0;
    for (std::string const& line : linesOf(agent().output())) {
        if (line.find("snmp.conf") == std::string::npos) continue;
        ++lines;
        EXPECT_THAT(line, AllOf(HasSubstr("line 2"), HasSubstr("rouserr"), HasSubstr("1 more")));
    }
    EXPECT_EQ(lines, 1) << agent().output();
}

TEST_F(ReloadTest, MissingFileChangesNothing) {
    startWith(kReader);
    ASSERT_EQ(std::remove(path("snmp.conf").c_str()), 0);
    agent().signal(SIGHUP);
    ASSERT_TRUE(agent().waitFor("keeping the previous SNMP configuration")) << agent().output();
    EXPECT_EQ(get("kvlBoardCount.0"), "Gauge32: 3 boards");
}

TEST_F(ReloadTest, WriterStillReachesTheSettingsOnly) {
    std::string const config = kReader + std::string("rwcommunity private 127.0.0.1\n");
    startWith(config);
    reload(config);
    auto const set = [this](std::string const& name, std::string const& type,
                            std::string const& value) {
        return snmp("snmpset", {"-v2c", "-c", "private", address(), name, type, value}).output;
    };
    EXPECT_THAT(set("1.3.6.1.2.1.1.6.0", "s", "elsewhere"), HasSubstr("noAccess"));
    EXPECT_THAT(set("1.3.6.1.2.1.31.1.1.1.14.1000", "i", "2"), HasSubstr("INTEGER: 2"));
}

TEST_F(ReloadTest, EngineStaysTheSame) {
    startWith(kReader);
    std::string const engine = get("1.3.6.1.6.3.10.2.1.1.0");
    std::string const boots = get("1.3.6.1.6.3.10.2.1.2.0");
    reload(kReader);
    EXPECT_EQ(get("1.3.6.1.6.3.10.2.1.1.0"), engine);
    EXPECT_EQ(get("1.3.6.1.6.3.10.2.1.2.0"), boots);
}

TEST_F(ReloadTest, StormOfSignalsEndsWithTheLastConfiguration) {
    startWith(kReader);
    for (int signal = 0; signal < 1000; ++signal)
        agent().signal(SIGHUP);
    configureSnmp(kReader + std::string("rocommunity last 127.0.0.1\n"));
    agent().signal(SIGHUP);
    EXPECT_TRUE(eventually([this] { return getAs("last", "kvlBoardCount.0").status == 0; }));
    EXPECT_EQ(stopAgent(), 0) << agent().output();
    EXPECT_THAT(agent().output(), Not(HasSubstr("keeping")));
}

} // namespace
} // namespace kvloamd::e2e
