// SPDX-License-Identifier: BSD-2-Clause
// kvlThresholdTable: what can be set, and what is read then.
#include <limits>

#include <gtest/gtest.h>

#include "agent/objects/ObjectTree.h"
#include "agent/objects/OwnObjects.h"

namespace kvloamd {
namespace {

class ThresholdTableTest : public ::testing::Test {
  protected:
    ThresholdTableTest() {
        ThresholdRow row;
        row.ifIndex = 1000;
        for (std::size_t threshold = 0; threshold < kThresholds; ++threshold)
            row.limits[threshold] = static_cast<int>(threshold);
        m_snapshot.thresholds = {row};
    }
    static Oid name(std::size_t threshold) {
        return {1, 1, 13, 1, 1, static_cast<std::uint32_t>(threshold + 2), 1000};
    }
    std::int64_t limit(std::size_t threshold) const {
        Instance found;
        EXPECT_EQ(m_tree.find(m_facts, name(threshold), found), Lookup::Found);
        return std::get<std::int64_t>(found.value);
    }
    SetFault set(std::size_t threshold, std::int64_t value) {
        std::optional<Change> change;
        SetFault const fault = m_tree.test(m_facts, name(threshold), Value{value}, change);
        if (change) m_settings.exchange(change->key, change->value);
        return fault;
    }

    Table const* const m_table = &thresholdTable();
    ObjectTree const m_tree{{}, {&m_table, 1}};
    Snapshot m_snapshot;
    Counters m_counters;
    Settings m_settings;
    Facts const m_facts{m_snapshot, m_counters, &m_settings};
};

TEST_F(ThresholdTableTest, LimitIsThatOfTheTypeUntilTheLineHasItsOwn) {
    for (std::size_t threshold = 0; threshold < kThresholds; ++threshold) {
        EXPECT_EQ(limit(threshold), static_cast<std::int64_t>(threshold));
        EXPECT_EQ(set(threshold, 77), SetFault::None);
        EXPECT_EQ(limit(threshold), 77);
        EXPECT_EQ(m_settings.find({thresholdSetting(threshold), 1000}), 77);
    }
}

TEST_F(ThresholdTableTest, OwnLimitOfZeroIsNone) {
    EXPECT_EQ(set(kCodeViolations24h, 0), SetFault::None);
    EXPECT_EQ(limit(kCodeViolations24h), 0);
}

TEST_F(ThresholdTableTest, MinusOneForgetsTheOwnLimit) {
    set(kCodeViolations24h, 77);
    EXPECT_EQ(set(kCodeViolations24h, -1), SetFault::None);
    EXPECT_EQ(limit(kCodeViolations24h), 9);
    EXPECT_TRUE(m_settings.all().empty());
}

TEST_F(ThresholdTableTest, OtherNumbersAreRefused) {
    EXPECT_EQ(set(0, -2), SetFault::WrongValue);
    EXPECT_EQ(set(0, std::int64_t{std::numeric_limits<int>::max()} + 1), SetFault::WrongValue);
    EXPECT_EQ(set(0, std::numeric_limits<int>::max()), SetFault::None);
}

} // namespace
} // namespace kvloamd
