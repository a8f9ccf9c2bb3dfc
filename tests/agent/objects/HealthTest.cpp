// SPDX-License-Identifier: BSD-2-Clause
// What the agent tells of itself.
#include <algorithm>
#include <stdexcept>
#include <string_view>

#include <gtest/gtest.h>

#include "agent/objects/OwnObjects.h"

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

class HealthTest : public ::testing::Test {
  protected:
    Value value(std::string_view name) {
        auto const found = std::ranges::find(scalars(), name, &Scalar::name);
        if (found == scalars().end()) throw std::runtime_error("no such scalar");
        return found->get(Facts{m_snapshot, m_counters});
    }
    std::int64_t number(std::string_view name) { return std::get<std::int64_t>(value(name)); }

    Snapshot m_snapshot;
    Counters m_counters;
};

TEST_F(HealthTest, UpTimeIsInHundredthsSinceTheStart) {
    m_counters.started = Clock::now() - 1h;
    EXPECT_GE(number("kvlAgentUpTime"), 360000);
}

TEST_F(HealthTest, UpTimeBeginsAnewWhenItsBitsAreUsedUp) {
    m_counters.started = Clock::now() - std::chrono::milliseconds(42949672960);
    EXPECT_LT(number("kvlAgentUpTime"), 4294967296);
}

TEST_F(HealthTest, AgeOfTheSnapshotCountsFromTheBeginningOfItsReading) {
    m_snapshot.begun = Clock::now() - 5s;
    EXPECT_GE(number("kvlSnapshotAge"), 5000);
}

TEST_F(HealthTest, RefreshTimesAreInMilliseconds) {
    m_snapshot.refreshTime = 20ms;
    m_snapshot.longestRefreshTime = 3s;
    EXPECT_EQ(number("kvlRefreshTime"), 20);
    EXPECT_EQ(number("kvlLongestRefreshTime"), 3000);
}

TEST_F(HealthTest, TimeThatDoesNotFitShowsAsTheLongest) {
    m_snapshot.refreshTime = std::chrono::hours(24 * 365);
    EXPECT_EQ(number("kvlRefreshTime"), 4294967295);
}

TEST_F(HealthTest, InterfacesAndLinesAreCounted) {
    m_snapshot.interfaces.interfaces.resize(3);
    m_snapshot.interfaces.lines.resize(2);
    EXPECT_EQ(number("kvlInterfaceCount"), 3);
    EXPECT_EQ(number("kvlLineCount"), 2);
}

TEST_F(HealthTest, CountsAreThoseOfTheCounters) {
    m_counters.requests = 4294967295U;
    m_counters.notificationsSent = 7;
    m_counters.notificationsWaiting = 3;
    m_snapshot.number = 9;
    EXPECT_EQ(number("kvlRequests"), 4294967295);
    EXPECT_EQ(number("kvlNotificationsSent"), 7);
    EXPECT_EQ(number("kvlNotificationsWaiting"), 3);
    EXPECT_EQ(number("kvlSnapshots"), 9);
}

TEST_F(HealthTest, PersistenceIsThatOfTheSnapshot) {
    EXPECT_EQ(number("kvlPersistence"), 1);
    m_snapshot.persistence = Persistence::Failing;
    EXPECT_EQ(number("kvlPersistence"), 3);
}

TEST_F(HealthTest, StandAloneAgentHasNoMaster) {
    EXPECT_EQ(number("kvlAgentFront"), 1);
    EXPECT_FALSE(isKnown(value("kvlMasterState")));
    EXPECT_FALSE(isKnown(value("kvlMasterLosses")));
}

TEST_F(HealthTest, SubagentTellsOfItsMaster) {
    m_counters.master = Master::Connected;
    m_counters.masterLosses = 2;
    EXPECT_EQ(number("kvlAgentFront"), 2);
    EXPECT_EQ(number("kvlMasterState"), 1);
    EXPECT_EQ(number("kvlMasterLosses"), 2);
    m_counters.master = Master::Lost;
    EXPECT_EQ(number("kvlAgentFront"), 2);
    EXPECT_EQ(number("kvlMasterState"), 2);
}

} // namespace
} // namespace kvloamd
