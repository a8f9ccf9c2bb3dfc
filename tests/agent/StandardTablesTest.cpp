// SPDX-License-Identifier: BSD-2-Clause
// The standard MIB modules' tables over rows that a test makes.
#include <gmock/gmock.h>

#include "agent/ObjectTree.h"
#include "agent/StandardObjects.h"

namespace kvloamd {
namespace {

/// Lines 10 with two closed intervals, 20 without history, 30 with a full one, 40 with none closed.
class StandardTablesTest : public ::testing::Test {
  protected:
    StandardTablesTest() {
        std::size_t before = 0;
        for (auto const& [index, records] :
             {std::pair{10U, 3U}, std::pair{20U, 0U}, std::pair{30U, 97U}, std::pair{40U, 1U}}) {
            LineRow line;
            line.ifIndex = index;
            for (std::uint32_t n = 0; n < records; ++n) {
                LineCounts counts{};
                for (std::size_t i = 0; i < counts.size(); ++i)
                    counts[i] = static_cast<std::int32_t>(index * 10000 + n * 100 + i);
                line.intervals.push_back(counts);
            }
            line.intervalsBefore = before;
            before += line.closedIntervals();
            m_snapshot.interfaces.lines.push_back(std::move(line));
        }
    }

    Lookup find(Oid const& name) { return m_tree.find(m_facts, name, m_found); }
    Oid next(Oid const& name, bool orEqual = false) {
        return m_tree.next(m_facts, name, orEqual, m_found) ? m_found.name : Oid{};
    }
    std::int64_t numberAt(Oid const& name) {
        return find(name) == Lookup::Found ? std::get<std::int64_t>(m_found.value) : -1;
    }

    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Facts const m_facts{m_snapshot, m_counters};
    Instance m_found;
};

TEST_F(StandardTablesTest, EveryTableIsBelowAPlaceThatIsServed) {
    for (Table const* const table : m_tables)
        EXPECT_TRUE(std::ranges::any_of(kStandardPlaces, [&](Oid const& place) {
            return startsWith(table->entry(), place);
        })) << table->name();
}

TEST_F(StandardTablesTest, ColumnsAscendInEveryTable) {
    for (Table const* const table : m_tables)
        for (std::size_t column = 1; column < table->columnCount(); ++column)
            EXPECT_LT(table->column(column - 1).number, table->column(column).number)
                << table->name();
}

TEST_F(StandardTablesTest, CounterHasItsLow32BitsInTheTableAndAllInTheOther) {
    InterfaceRow row;
    row.ifIndex = 7;
    row.counters[kInOctets] = 0x8000000000000005U;
    m_snapshot.interfaces.interfaces = {row};
    EXPECT_EQ(numberAt({2, 2, 1, 10, 7}), 5);
    ASSERT_EQ(find({31, 1, 1, 1, 6, 7}), Lookup::Found);
    EXPECT_EQ(m_found.type, ValueType::Counter64);
    EXPECT_EQ(static_cast<std::uint64_t>(std::get<std::int64_t>(m_found.value)),
              0x8000000000000005U);
    EXPECT_EQ(find({31, 1, 1, 1, 10, 7}), Lookup::NoSuchInstance); // never told
}

TEST_F(StandardTablesTest, HighSpeedIsRounded) {
    for (auto const& [speed, rounded] :
         {std::pair{64000U, 0}, {1544000U, 2}, {1499999U, 1}, {4294967295U, 4295}}) {
        InterfaceRow row;
        row.ifIndex = 7;
        row.speed = speed;
        m_snapshot.interfaces.interfaces = {row};
        EXPECT_EQ(numberAt({31, 1, 1, 1, 15, 7}), rounded);
    }
}

TEST_F(StandardTablesTest, InterfaceCountIsThatOfTheRows) {
    EXPECT_EQ(numberAt({2, 1, 0}), 0);
    m_snapshot.interfaces.interfaces.resize(3);
    EXPECT_EQ(numberAt({2, 1, 0}), 3);
}

} // namespace
} // namespace kvloamd
