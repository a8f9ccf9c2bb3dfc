// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/EntityNotices.h"

#include <algorithm>
#include <functional>
#include <optional>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

Oid const kConfigChange{1, 3, 6, 1, 2, 1, 47, 2, 0, 1};
Oid const kEnabled{1, 3, 6, 1, 2, 1, 131, 0, 1};
Oid const kDisabled{1, 3, 6, 1, 2, 1, 131, 0, 2};

/// Makes snapshots at chosen times.
class EntityNoticesTest : public ::testing::Test {
  protected:
    /// Publishes the next snapshot at `m_now`.
    auto tell() { return m_notices.update(std::make_shared<Snapshot>(m_next), m_now); }
    /// Changes the entities and publishes the snapshot.
    auto tellChange() {
        ++m_next.entities.lastChange;
        return tell();
    }
    void setOper(std::vector<std::pair<std::uint32_t, OperState>> const& states) {
        m_next.entities.states.clear();
        for (auto const& [entity, oper] : states) {
            EntityStateRow& row = m_next.entities.states.emplace_back();
            row.entity = entity;
            row.state.oper = oper;
        }
    }
    /// The names of the notifications queued since the last call.
    std::vector<Oid> told() {
        std::vector<Oid> names;
        while (auto notification = m_queue.pop())
            names.push_back(std::move(notification->name));
        return names;
    }

    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    EntityNotices m_notices{m_queue};
    Snapshot m_next;
    Clock::time_point m_now = Clock::now();
};

TEST_F(EntityNoticesTest, FirstSnapshotIsNoNews) {
    m_next.entities.lastChange = 7;
    setOper({{1, OperState::Enabled}});
    EXPECT_EQ(tell(), std::nullopt);
    EXPECT_EQ(tell(), std::nullopt);
    EXPECT_THAT(told(), IsEmpty());
}

TEST_F(EntityNoticesTest, ChangeIsToldAtOnceAndCarriesNothing) {
    tell();
    EXPECT_EQ(tellChange(), std::nullopt);
    auto const told = m_queue.pop();
    ASSERT_TRUE(told.has_value());
    EXPECT_EQ(told->name, kConfigChange);
    EXPECT_THAT(told->objects, IsEmpty());
    EXPECT_EQ(m_queue.size(), 0U);
}

TEST_F(EntityNoticesTest, ChangesWithinThePauseAreToldTogetherAtItsEnd) {
    tell();
    auto const first = m_now;
    tellChange();
    EXPECT_THAT(told(), SizeIs(1));
    m_now = first + 1s;
    EXPECT_EQ(tellChange(), first + EntityNotices::kPause);
    m_now = first + 2s;
    EXPECT_EQ(tellChange(), first + EntityNotices::kPause);
    m_now = first + EntityNotices::kPause - 1ms;
    EXPECT_EQ(tell(), first + EntityNotices::kPause);
    EXPECT_THAT(told(), IsEmpty());
    m_now = first + EntityNotices::kPause;
    EXPECT_EQ(tell(), std::nullopt);
    EXPECT_THAT(told(), ElementsAre(kConfigChange));
}

TEST_F(EntityNoticesTest, NextPauseBeginsWithWhatWasToldLate) {
    tell();
    auto const first = m_now;
    tellChange();
    m_now = first + 1s;
    tellChange();
    m_now = first + EntityNotices::kPause;
    tell();
    EXPECT_THAT(told(), SizeIs(2));
    m_now += 1s;
    EXPECT_EQ(tellChange(), first + 2 * EntityNotices::kPause);
    EXPECT_THAT(told(), IsEmpty());
}

TEST_F(EntityNoticesTest, ChangeAfterThePauseIsToldAtOnce) {
    tell();
    tellChange();
    m_now += EntityNotices::kPause;
    EXPECT_EQ(tellChange(), std::nullopt);
    EXPECT_THAT(told(), SizeIs(2));
}

TEST_F(EntityNoticesTest, SnapshotThatIsTheSameIsNoNewsAndEndsThePauseAllTheSame) {
    tell();
    tellChange();
    ++m_next.entities.lastChange;
    auto const newest = std::make_shared<Snapshot const>(m_next);
    m_notices.update(newest, m_now + 1s);
    EXPECT_THAT(told(), SizeIs(1));
    EXPECT_EQ(m_notices.update(newest, m_now + EntityNotices::kPause), std::nullopt);
    EXPECT_THAT(told(), SizeIs(1));
}

TEST_F(EntityNoticesTest, EntityThatIsDisabledIsToldWithItsStateAndAlarm) {
    setOper({{17, OperState::Enabled}, {20, OperState::Enabled}});
    tell();
    setOper({{17, OperState::Enabled}, {20, OperState::Disabled}});
    m_next.entities.states.edit(1).state.admin = AdminState::Locked;
    m_next.entities.states.edit(1).state.alarm = static_cast<char>(kAlarmCritical);
    m_next.begun = Clock::now();
    tell();
    auto const told = m_queue.pop();
    ASSERT_TRUE(told.has_value());
    EXPECT_EQ(told->name, kDisabled);
    EXPECT_EQ(told->when, m_next.begun); // the snapshot shows the change already
    ASSERT_THAT(told->objects, SizeIs(2));
    EXPECT_EQ(told->objects[0].name, (Oid{1, 3, 6, 1, 2, 1, 131, 1, 1, 1, 2, 20}));
    EXPECT_EQ(told->objects[0].view(), Value{std::int64_t{2}});
    EXPECT_EQ(told->objects[1].name, (Oid{1, 3, 6, 1, 2, 1, 131, 1, 1, 1, 5, 20}));
    EXPECT_EQ(told->objects[1].view(), Value{std::string_view("\x20")});
    EXPECT_EQ(m_queue.size(), 0U);
}

TEST_F(EntityNoticesTest, EntityThatBecomesEnabledFromAnyOtherStateIsTold) {
    setOper({{1, OperState::Disabled}, {2, OperState::Unknown}, {3, OperState::Testing}});
    tell();
    setOper({{1, OperState::Enabled}, {2, OperState::Enabled}, {3, OperState::Enabled}});
    tell();
    EXPECT_THAT(told(), ElementsAre(kEnabled, kEnabled, kEnabled));
}

/// Many entities change their state at once.
class EntityNoticesBurstTest : public EntityNoticesTest {
  protected:
    static constexpr std::uint32_t kMany = 2 * EntityNotices::kBatch + 1;

    void setAll(OperState oper) {
        std::vector<std::pair<std::uint32_t, OperState>> states;
        for (std::uint32_t entity = 1; entity <= kMany; ++entity)
            states.emplace_back(entity, oper);
        setOper(states);
    }
    /// The entities of the notifications queued since the last call.
    std::vector<std::uint32_t> entitiesTold() {
        std::vector<std::uint32_t> entities;
        while (auto const notification = m_queue.pop())
            entities.push_back(notification->subject.entity);
        return entities;
    }
    /// Calls again, as long as that is wanted at once, with the snapshot that was published last.
    void tellTheRest(std::shared_ptr<Snapshot const> const& newest) {
        while (m_notices.update(newest, m_now) == m_now) {
        }
    }
};

TEST_F(EntityNoticesBurstTest, StatesAreToldInBatchesInTheirOrder) {
    setAll(OperState::Enabled);
    tell();
    setAll(OperState::Disabled);
    auto const newest = std::make_shared<Snapshot const>(m_next);
    std::vector<std::uint32_t> all;
    for (std::optional<Clock::time_point> again = m_now; again;) {
        again = m_notices.update(newest, m_now);
        auto const batch = entitiesTold();
        EXPECT_LE(batch.size(), EntityNotices::kBatch);
        EXPECT_EQ(again.has_value(), batch.size() == EntityNotices::kBatch);
        all.insert(all.end(), batch.begin(), batch.end());
    }
    ASSERT_THAT(all, SizeIs(kMany));
    EXPECT_TRUE(std::ranges::is_sorted(all, std::ranges::less_equal{}));
}

TEST_F(EntityNoticesBurstTest, SnapshotThatArrivesMeanwhileIsToldAfterTheOneBefore) {
    setAll(OperState::Enabled);
    tell();
    setAll(OperState::Disabled);
    EXPECT_EQ(tell(), m_now);
    setAll(OperState::Enabled);
    auto const newest = std::make_shared<Snapshot const>(m_next);
    tellTheRest(newest);
    std::vector<Oid> const all = told();
    ASSERT_THAT(all, SizeIs(2 * kMany));
    EXPECT_EQ(std::count(all.begin(), all.begin() + kMany, kDisabled), kMany);
    EXPECT_EQ(std::count(all.begin() + kMany, all.end(), kEnabled), kMany);
}

TEST_F(EntityNoticesBurstTest, ChangeOfTheEntitiesIsToldAfterTheirStates) {
    setAll(OperState::Enabled);
    tell();
    setAll(OperState::Disabled);
    ++m_next.entities.lastChange;
    auto const newest = std::make_shared<Snapshot const>(m_next);
    tellTheRest(newest);
    std::vector<Oid> const all = told();
    ASSERT_THAT(all, SizeIs(kMany + 1));
    EXPECT_EQ(all.back(), kConfigChange);
}

TEST_F(EntityNoticesBurstTest, NothingIsLeftWhenTheAgentStops) {
    setAll(OperState::Enabled);
    tell();
    setAll(OperState::Disabled);
    EXPECT_EQ(tell(), m_now);
    m_notices.finish();
    EXPECT_THAT(told(), SizeIs(kMany));
}

TEST_F(EntityNoticesTest, OtherStatesAreNotTold) {
    setOper({{1, OperState::Disabled}, {2, OperState::Enabled}});
    tell();
    setOper({{1, OperState::Unknown}, {2, OperState::Testing}});
    m_next.entities.states.edit(0).state.usage = UsageState::Idle;
    tell();
    EXPECT_THAT(told(), IsEmpty());
}

TEST_F(EntityNoticesTest, EntityThatComesOrGoesHasNotChangedItsState) {
    setOper({{1, OperState::Enabled}, {3, OperState::Enabled}});
    tell();
    setOper({{2, OperState::Disabled}, {3, OperState::Disabled}, {4, OperState::Enabled}});
    tell();
    auto const told = m_queue.pop();
    ASSERT_TRUE(told.has_value());
    EXPECT_EQ(told->objects.at(0).name.back(), 3U);
    EXPECT_EQ(m_queue.size(), 0U);
    setOper({});
    tell();
    EXPECT_EQ(m_queue.size(), 0U);
}

} // namespace
} // namespace kvloamd
