// SPDX-License-Identifier: BSD-2-Clause
// The agent's answers conform to the MIB modules, except as mibs/conformance.ini says.
#include <csignal>
#include <iostream>
#include <map>

#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class ConformanceTest : public AgentFixture {
  protected:
    static constexpr char kClosedIntervals[] = "1.3.6.1.2.1.10.18.6.1.4.1000";

    void serve() {
        startAgent();
        // The past of the lines is there from the first second that they count.
        ASSERT_TRUE(eventually([this] { return get(kClosedIntervals).starts_with("INTEGER: "); }));
    }
    Result check() {
        return run({SOURCE_DIR "/tests/mibs/check-conformance", SOURCE_DIR, address()});
    }
    /// The check finds a fault in the edited answers.
    void expectFinds(std::string const& edit, std::string const& fault) {
        editWalks(edit);
        Result const checked = check();
        EXPECT_NE(checked.status, 0);
        EXPECT_THAT(checked.output, HasSubstr(fault));
    }
};

TEST_F(ConformanceTest, EveryObjectHasALegalValueOrAReasonToHaveNone) {
    serve();
    Result const checked = check();
    std::cout << checked.output;
    EXPECT_EQ(checked.status, 0);
}

TEST_F(ConformanceTest, CheckFindsAValueThatTheEnumerationDoesNotHave) {
    serve();
    expectFinds(R"(s/^\(\.1\.3\.6\.1\.2\.1\.2\.2\.1\.3\.1000 = INTEGER:\).*/\1 999/)",
                "IF-MIB::ifType.1000 is 999, which the enumeration does not have");
}

TEST_F(ConformanceTest, CheckFindsAWrongType) {
    serve();
    expectFinds(R"(s/^\(\.1\.3\.6\.1\.2\.1\.2\.2\.1\.3\.1000 = \)INTEGER:/\1Gauge32:/)",
                "IF-MIB::ifType.1000 is a Gauge32, not INTEGER");
}

TEST_F(ConformanceTest, CheckFindsARowWithoutAValue) {
    serve();
    expectFinds(R"(/^\.1\.3\.6\.1\.2\.1\.2\.2\.1\.3\.1000 /d)",
                "ifType has no value in the rows 1000, and no \"some rows\" says why");
}

TEST_F(ConformanceTest, CheckFindsAnIndexThatIsOutOfRange) {
    serve();
    expectFinds(R"(s/^\.1\.3\.6\.1\.2\.1\.2\.2\.1\.3\.1000 /.1.3.6.1.2.1.2.2.1.3.0 /)",
                "IF-MIB::ifType.0: the index ifIndex is 0");
}

TEST_F(ConformanceTest, NotificationsContainWhatTheirModulesSay) {
    startTrapReceiver("authCommunity log public\n", {"-m", "", "-OnxU", "-Oe"});
    configureSnmp("rwcommunity public 127.0.0.1\ntrap2sink " + trapAddress() + " public\n");
    serve();
    ask("snmpset", {"1.3.6.1.2.1.10.18.6.1.17.1000", "i", "1"});
    // The signalling channel D1.
    ask("snmpset", {"1.3.6.1.2.1.10.20.1.3.2.1.7.1034", "i", "1"});
    sim({"call", "setup", "301"});
    sim({"line", "alarm", "101", "los"});
    sim({"fault", "3", "17"});
    sim({"stop", "2"});
    std::map<std::string, std::string> const wanted{
        {"linkDown", "1.3.6.1.6.3.1.1.5.3"},
        {"dsx1LineStatusChange", "1.3.6.1.2.1.10.18.15.0.1"},
        {"isdnMibCallInformation", "1.3.6.1.2.1.10.20.2.0.1"},
        {"entConfigChange", "1.3.6.1.2.1.47.2.0.1"},
        {"entStateOperDisabled", "1.3.6.1.2.1.131.0.2"},
        {"kvlBoardStatusChange", "1.3.6.1.4.1.32473.1.0.1"},
        {"kvlFaultRaised", "1.3.6.1.4.1.32473.1.0.2"}};
    std::vector<std::string> command{SOURCE_DIR "/tests/mibs/check-notifications", SOURCE_DIR,
                                     address(), path("received")};
    for (auto const& [name, number] : wanted) {
        EXPECT_TRUE(trapReceiver().waitFor("= OID: ." + number)) << name;
        command.push_back(name);
    }
    trapReceiver().signal(SIGTERM);
    trapReceiver().wait(); // for the rest of what it prints
    write(path("received"), trapReceiver().output());
    Result const checked = run(command);
    std::cout << checked.output;
    EXPECT_EQ(checked.status, 0) << trapReceiver().output();
}

} // namespace
} // namespace kvloamd::e2e
