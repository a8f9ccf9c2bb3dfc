// SPDX-License-Identifier: BSD-2-Clause
// Access by community and by SNMPv3 user.
#include <csignal>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;
using ::testing::Not;
using ::testing::SizeIs;

class SecurityTest : public AgentFixture {
  protected:
    void startWithUser() {
        configureSnmp("createUser op SHA authpass1 AES privpass1\n"
                      "rouser op priv\n");
        startAgent();
    }
    /// Asks for the number of boards as a user of version 3.
    Result askAs(std::string const& user, std::string const& authentication,
                 std::string const& privacy, std::string const& level = "authPriv") {
        return snmp("snmpget",
                    {"-v3", "-u", user, "-l", level, "-a", "SHA", "-A", authentication, "-x", "AES",
                     "-X", privacy, "-t", "5", "-r", "0", address(), "kvlBoardCount.0"});
    }
    Result askAsCommunity(std::string const& community) {
        return snmp("snmpget",
                    {"-v2c", "-c", community, "-t", "1", "-r", "0", address(), "kvlBoardCount.0"});
    }
};

TEST_F(SecurityTest, UserWithBothPasswordsIsAnswered) {
    startWithUser();
    Result const result = askAs("op", "authpass1", "privpass1");
    EXPECT_EQ(result.status, 0);
    EXPECT_THAT(result.output, HasSubstr("Gauge32: 3 boards"));
}

TEST_F(SecurityTest, WrongPasswordIsRefused) {
    startWithUser();
    Result const result = askAs("op", "wrongpass", "privpass1");
    EXPECT_NE(result.status, 0);
    EXPECT_THAT(result.output, HasSubstr("Authentication failure"));
}

TEST_F(SecurityTest, RepeatedWrongPasswordsDoNotFillTheLog) {
    startWithUser();
    for (int attempt = 0; attempt < 5; ++attempt)
        askAs("op", "wrongpass", "privpass1");
    stopAgent();
    EXPECT_THAT(agent().output(), HasSubstr("Authentication failed for op"));
    EXPECT_THAT(linesOf(agent().output()), SizeIs(4))
        << agent().output(); // and the lines of start and stop
}

TEST_F(SecurityTest, WrongPrivacyPasswordIsRefused) {
    startWithUser();
    Result const result = askAs("op", "authpass1", "wrongpass");
    EXPECT_NE(result.status, 0);
    EXPECT_THAT(result.output, Not(HasSubstr("Gauge32")));
}

TEST_F(SecurityTest, UnknownUserIsRefused) {
    startWithUser();
    Result const result = askAs("nobody", "authpass1", "privpass1");
    EXPECT_NE(result.status, 0);
    EXPECT_THAT(result.output, HasSubstr("Unknown user name"));
}

TEST_F(SecurityTest, UserWithoutPrivacyIsRefusedWhereItIsAskedFor) {
    startWithUser();
    Result const result = askAs("op", "authpass1", "privpass1", "authNoPriv");
    EXPECT_NE(result.status, 0);
    EXPECT_THAT(result.output, Not(HasSubstr("Gauge32")));
}

TEST_F(SecurityTest, CommunityGetsNoAnswerWhereNoneIsConfigured) {
    startWithUser();
    EXPECT_THAT(askAsCommunity("public").output, HasSubstr("No Response"));
}

TEST_F(SecurityTest, WrongCommunityGetsNoAnswer) {
    startAgent();
    EXPECT_THAT(askAsCommunity("guess").output, HasSubstr("No Response"));
    EXPECT_THAT(askAsCommunity("public").output, HasSubstr("Gauge32"));
}

TEST_F(SecurityTest, NobodyGetsAnAnswerWhereNobodyIsConfigured) {
    configureSnmp("");
    startAgent();
    EXPECT_THAT(agent().output(), HasSubstr("nobody gets an answer"));
    EXPECT_THAT(askAsCommunity("public").output, HasSubstr("No Response"));
}

TEST_F(SecurityTest, EngineKeepsItsNameAndCountsItsStarts) {
    static constexpr char kEngineId[] = "1.3.6.1.6.3.10.2.1.1.0";
    static constexpr char kEngineBoots[] = "1.3.6.1.6.3.10.2.1.2.0";
    startAgent();
    std::string const engine = get(kEngineId);
    EXPECT_EQ(get(kEngineBoots), "INTEGER: 1");
    EXPECT_EQ(stopAgent(), 0);
    startAgent();
    EXPECT_EQ(get(kEngineId), engine);
    EXPECT_EQ(get(kEngineBoots), "INTEGER: 2");
}

TEST_F(SecurityTest, EngineKeepsItsNameAndCountsItsStartsWhateverEndsIt) {
    static constexpr char kEngineId[] = "1.3.6.1.6.3.10.2.1.1.0";
    static constexpr char kEngineBoots[] = "1.3.6.1.6.3.10.2.1.2.0";
    startAgent();
    std::string const engine = get(kEngineId);
    for (int boots = 2; boots <= 4; ++boots) {
        agent().signal(SIGKILL);
        agent().wait();
        startAgent();
        EXPECT_EQ(get(kEngineId), engine);
        EXPECT_EQ(get(kEngineBoots), "INTEGER: " + std::to_string(boots));
    }
}

TEST_F(SecurityTest, EngineStateThatCannotBeSavedIsReported) {
    write(path("persistent"), "a file where the directory should be");
    startAgent();
    EXPECT_THAT(agent().output(), HasSubstr("SNMPv3 engine state cannot be saved"));
}

} // namespace
} // namespace kvloamd::e2e
