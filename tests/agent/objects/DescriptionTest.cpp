// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/Description.h"

#include <algorithm>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr NamedNumber kStates[] = {{1, "up"}, {3, "testing"}};

Value status(InterfaceRow const& row) {
    return std::int64_t{row.linkUpDownTraps};
}

constexpr Column<InterfaceRow> kColumns[] = {
    {"closed", 1, ValueType::Integer, status, about("A state").oneOf(kStates)},
    {"open", 2, ValueType::Integer, status, about("A state").someOf(kStates)},
    {"plain", 3, ValueType::Integer, status},
};

Rows<InterfaceRow> const& rows(Snapshot const& snapshot) {
    return snapshot.interfaces.interfaces;
}

class DescriptionTest : public ::testing::Test {
  protected:
    /// The value of a column whose getter answers `number`.
    Value valueOf(std::size_t column, int number) {
        m_snapshot.interfaces.interfaces.resize(1);
        m_snapshot.interfaces.interfaces.edit(0).linkUpDownTraps = number;
        return m_table.value(Facts{m_snapshot, m_counters}, column, 0);
    }

    RowTable<InterfaceRow, rows> const m_table{"table", {1, 1}, kColumns};
    Snapshot m_snapshot;
    Counters m_counters;
};

TEST_F(DescriptionTest, NumberThatTheModuleNamesIsServed) {
    EXPECT_EQ(valueOf(0, 1), Value{std::int64_t{1}});
    EXPECT_EQ(valueOf(0, 3), Value{std::int64_t{3}});
}

TEST_F(DescriptionTest, NumberThatTheModuleHasNoNameForIsNotKnown) {
    EXPECT_FALSE(isKnown(valueOf(0, 2)));
    EXPECT_FALSE(isKnown(valueOf(0, -1)));
}

TEST_F(DescriptionTest, OtherNumbersAreServedWhereTheyAreLegal) {
    EXPECT_EQ(valueOf(1, 2), Value{std::int64_t{2}});
    EXPECT_EQ(valueOf(2, 2), Value{std::int64_t{2}});
}

TEST_F(DescriptionTest, RowIsFoundWhateverWasFoundBefore) {
    Snapshot few;
    for (std::uint32_t const index : {2U, 4U, 6U, 8U, 10U})
        m_snapshot.interfaces.interfaces.emplace_back().ifIndex = index;
    few.interfaces.interfaces.emplace_back().ifIndex = 4;
    auto const find = [&](Snapshot const& snapshot, std::uint32_t index, bool orEqual) {
        std::uint32_t const name[] = {index};
        return m_table.firstRow(Facts{snapshot, m_counters}, name, orEqual);
    };
    for (std::uint32_t former = 0; former < 12; ++former)
        for (std::uint32_t index = 0; index < 12; ++index)
            for (bool const orEqual : {false, true}) {
                find(m_snapshot, former, orEqual);
                // So many of the even numbers lie below, or below or at the index.
                std::uint32_t const above = orEqual ? index : index + 1;
                std::size_t const before = std::min(above == 0 ? 0U : (above - 1U) / 2U, 5U);
                EXPECT_EQ(find(m_snapshot, index, orEqual), before)
                    << former << ' ' << index << ' ' << orEqual;
                find(m_snapshot, former, orEqual);
                EXPECT_EQ(find(few, index, orEqual), (orEqual ? index > 4 : index >= 4) ? 1U : 0U)
                    << former << ' ' << index << ' ' << orEqual;
            }
}

TEST_F(DescriptionTest, HeadTellsWhatPeopleNeed) {
    ColumnHead const head = m_table.column(0);
    EXPECT_STREQ(head.details.help, "A state");
    EXPECT_EQ(head.details.names.size(), 2U);
    EXPECT_FALSE(head.details.isIdentifying);
}

TEST_F(DescriptionTest, KindFollowsFromTheTypeUnlessItIsNamed) {
    EXPECT_EQ(kindOf(ValueType::Counter64, {}), Kind::Counter);
    EXPECT_EQ(kindOf(ValueType::Gauge, {}), Kind::Gauge);
    EXPECT_EQ(kindOf(ValueType::TimeStamp, {}), Kind::Time);
    EXPECT_EQ(kindOf(ValueType::Text, {}), Kind::Information);
    EXPECT_EQ(kindOf(ValueType::Integer, about("").oneOf(kStates)), Kind::State);
    EXPECT_EQ(kindOf(ValueType::Integer, about("").oneOf(kStates).as(Kind::Information)),
              Kind::Information);
}

TEST_F(DescriptionTest, DetailsAddUp) {
    constexpr Details kDetails =
        about("The name").in("words").settable({Setting::InterfaceAlias, 0, 64}).identifies();
    EXPECT_STREQ(kDetails.help, "The name");
    EXPECT_STREQ(kDetails.unit, "words");
    EXPECT_TRUE(kDetails.isIdentifying);
    ASSERT_TRUE(kDetails.writable);
    EXPECT_EQ(kDetails.writable->highest, 64);
}

} // namespace
} // namespace kvloamd
