// SPDX-License-Identifier: BSD-2-Clause
#include "agent/daemon/StaleSnapshot.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class StaleSnapshotTest : public ::testing::Test {
  protected:
    StaleSnapshotTest() {
        auto snapshot = std::make_shared<Snapshot>();
        snapshot->begun = m_begun;
        snapshot->alarms = m_tables.rows();
        m_newest = snapshot;
    }
    std::shared_ptr<Snapshot const> after(std::chrono::milliseconds age) {
        return m_stale.of(m_newest, m_begun + age);
    }
    void raise(AlarmKind kind) {
        m_list.begin({{kind, {}, 0}, "agent", 0, 0, {}, {}}, Instant::now());
    }

    Clock::time_point const m_begun = Clock::now();
    std::uint32_t m_last = 0;
    AlarmList m_list{{}, [this](AlarmEvent, Alarm const&) { return ++m_last; }};
    AlarmTables m_tables{m_list, {1, 3, 9}, m_begun};
    StaleSnapshot m_stale{m_tables};
    std::shared_ptr<Snapshot const> m_newest;
};

TEST_F(StaleSnapshotTest, RecentSnapshotIsServedAsItIs) {
    raise(AlarmKind::NotificationsDropped);
    EXPECT_EQ(after(HealthWatch::kStale - std::chrono::milliseconds(1)), m_newest);
}

TEST_F(StaleSnapshotTest, StaleSnapshotGetsTheAlarmsOfNow) {
    EXPECT_EQ(after(HealthWatch::kStale), m_newest);
    raise(AlarmKind::SnapshotStale);
    auto const served = after(HealthWatch::kStale);
    ASSERT_EQ(served->alarms->alarms.size(), 1U);
    EXPECT_EQ(served->alarms->alarms.front().kind, "agentSnapshotStale");
    EXPECT_EQ(served->begun, m_newest->begun);
}

TEST_F(StaleSnapshotTest, StaleSnapshotIsNotCopiedMoreOftenThanOnceInASecond) {
    raise(AlarmKind::SnapshotStale);
    auto const first = after(HealthWatch::kStale);
    raise(AlarmKind::NotificationsDropped);
    EXPECT_EQ(after(HealthWatch::kStale + std::chrono::milliseconds(999)), first);
    EXPECT_EQ(after(HealthWatch::kStale + std::chrono::seconds(1))->alarms->alarms.size(), 2U);
}

} // namespace
} // namespace kvloamd
