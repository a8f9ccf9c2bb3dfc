// SPDX-License-Identifier: BSD-2-Clause
// What the agent tells of itself.
#include <algorithm>
#include <stdexcept>
#include <string_view>

#include <gtest/gtest.h>

#include "agent/objects/ObjectTree.h"
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

TEST_F(HealthTest, TimesOfChangeAreThoseOfSysUpTimeAndTheUpTimeIsTheAgentsOwn) {
    auto const now = Clock::now();
    m_counters.started = now - 1h;
    m_snapshot.lastChange = 100000;
    ObjectTree const tree(scalars(), {});
    auto const served = [&](Oid name) {
        Instance found;
        EXPECT_EQ(tree.find({m_snapshot, m_counters}, name, found), Lookup::Found);
        EXPECT_EQ(found.type, ValueType::TimeTicks);
        return std::get<std::int64_t>(found.value);
    };
    Oid const change{1, 1, 2, 2, 0};
    Oid const upTime{1, 1, 9, 1, 0};
    EXPECT_EQ(served(change), 100000);
    // The master has been up for two hours.
    m_counters.setSysUpTime(720000, now);
    EXPECT_EQ(served(change), 460000);
    EXPECT_LT(served(upTime), 720000);
    // It has started anew: the change was before.
    m_counters.setSysUpTime(1, now);
    EXPECT_EQ(served(change), 0);
    // What has not changed since the agent's start has not.
    m_snapshot.lastChange = 0;
    m_counters.setSysUpTime(720000, now);
    EXPECT_EQ(served(change), 0);
}

TEST_F(HealthTest, DelaysOfTheMastersAnswersMoveNoTimes) {
    auto const when = Clock::now() + 1h;
    m_counters.setSysUpTime(720000, when);
    auto const lead = m_counters.sysUpTimeLead.load();
    m_counters.setSysUpTime(720005, when);
    EXPECT_EQ(m_counters.sysUpTimeLead, lead);
    m_counters.setSysUpTime(720500, when);
    EXPECT_EQ(m_counters.sysUpTimeLead, lead + 500);
}

TEST_F(HealthTest, StandAloneAgentHasNoMaster) {
    EXPECT_FALSE(isKnown(value("kvlInterfaceConflicts")));
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
    m_snapshot.interfaceConflicts = 3;
    EXPECT_EQ(number("kvlInterfaceConflicts"), 3);
    m_counters.master = Master::Lost;
    EXPECT_EQ(number("kvlAgentFront"), 2);
    EXPECT_EQ(number("kvlMasterState"), 2);
}

} // namespace
} // namespace kvloamd
