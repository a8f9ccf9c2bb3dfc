// SPDX-License-Identifier: BSD-2-Clause
// The agent's own state, as clients see it.
#include <gmock/gmock.h>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {
namespace {

using ::testing::HasSubstr;

class HealthTest : public AgentFixture {
  protected:
    /// The number in an answer such as "Gauge32: 3 lines".
    unsigned long number(std::string const& name) const {
        std::string const value = get(name);
        auto const at = value.find(": ");
        if (at == std::string::npos) throw std::runtime_error(name + ": " + value);
        return std::stoul(value.substr(at + 2));
    }
};

TEST_F(HealthTest, StandAloneAgentSaysSo) {
    startAgent();
    EXPECT_EQ(get("kvlAgentFront.0"), "INTEGER: standAlone(1)");
    EXPECT_THAT(get("kvlMasterState.0"), HasSubstr("No Such Instance"));
    EXPECT_THAT(get("kvlMasterLosses.0"), HasSubstr("No Such Instance"));
}

TEST_F(HealthTest, EveryRequestIsCountedOnce) {
    startAgent();
    unsigned long const before = number("kvlRequests.0");
    answers("snmpget", {"kvlBoardCount.0", "kvlBoardStatus.1", "1.3.6.1.2.1.2.1.0"});
    answers("snmpbulkget", {"-Cr20", "kvlBoardStatus", "kvlBoardName"});
    EXPECT_EQ(number("kvlRequests.0"), before + 3);
}

TEST_F(HealthTest, SnapshotsAreCountedAndYoungWhileRequestsCome) {
    startAgent();
    unsigned long const before = number("kvlSnapshots.0");
    EXPECT_TRUE(eventually([&] { return number("kvlSnapshots.0") > before + 1; }));
    EXPECT_LE(number("kvlRefreshTime.0"), number("kvlLongestRefreshTime.0"));
}

TEST_F(HealthTest, UpTimeGoesOn) {
    startAgent();
    auto const ticks = [this] {
        std::string const value = get("kvlAgentUpTime.0");
        return std::stoul(value.substr(value.find('(') + 1));
    };
    unsigned long const before = ticks();
    EXPECT_TRUE(eventually([&] { return ticks() > before; }));
}

TEST_F(HealthTest, InterfacesAndLinesAreThoseOfTheStandardTables) {
    startAgent();
    EXPECT_EQ(number("kvlInterfaceCount.0"), walk("1.3.6.1.2.1.2.2.1.1").size());
    EXPECT_EQ(number("kvlLineCount.0"), walk("1.3.6.1.2.1.10.18.6.1.1").size());
}

TEST_F(HealthTest, NotificationsThatWereSentAreCounted) {
    startAgent();
    sim({"fault", "2", "17"});
    sim({"fault", "2", "17", "--clear"});
    // With coldStart.
    EXPECT_TRUE(eventually([this] { return number("kvlNotificationsSent.0") == 3; }));
    EXPECT_EQ(number("kvlNotificationsWaiting.0"), 0U);
}

} // namespace
} // namespace kvloamd::e2e
