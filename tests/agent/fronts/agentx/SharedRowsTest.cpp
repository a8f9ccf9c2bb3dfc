// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/agentx/SharedRows.h"

#include <algorithm>
#include <functional>

#include <gmock/gmock.h>

#include "agent/objects/StandardObjects.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

Oid column(Oid const& place) {
    return joined(kStandardArc, place);
}

/// ifTable, of interfaces that have an index, a description and perhaps a speed.
class SharedRowsTest : public ::testing::Test {
  protected:
    static std::vector<Place> places() {
        return {{{2, 1}, "ifNumber", HostHas::All},
                {{2, 2, 1, 1}, "ifTable", HostHas::Rows},
                {{2, 2, 1, 2}, "ifTable", HostHas::Rows},
                {{2, 2, 1, 5}, "ifTable", HostHas::Rows},
                {{10, 18}, "DS1-MIB"}};
    }
    /// There are interfaces of these indices, some with a speed.
    void update(std::vector<std::uint32_t> const& indices,
                std::vector<std::uint32_t> const& withSpeed = {}) {
        m_snapshot.interfaces.interfaces.clear();
        for (std::uint32_t const index : indices) {
            InterfaceRow row;
            row.ifIndex = index;
            if (std::ranges::find(withSpeed, index) != withSpeed.end()) row.speed = 64000;
            m_snapshot.interfaces.interfaces.push_back(row);
        }
        m_rows.update({m_snapshot, m_counters}, m_now);
    }
    /// Does all steps; returns those of one column.
    std::vector<SharedRows::Step> doAll(std::uint32_t of) {
        std::vector<SharedRows::Step> steps;
        while (auto const step = m_rows.next()) {
            if (step->range.column == column({2, 2, 1, of})) steps.push_back(*step);
            m_rows.done();
        }
        return steps;
    }
    static SharedRows::Step enters(std::uint32_t of, std::uint32_t first, std::uint32_t last) {
        return {true, {column({2, 2, 1, of}), first, last}};
    }
    static SharedRows::Step leaves(std::uint32_t of, std::uint32_t first, std::uint32_t last) {
        return {false, {column({2, 2, 1, of}), first, last}};
    }

    std::vector<Table const*> const m_tables = standardTables();
    ObjectTree const m_tree{standardScalars(), m_tables};
    Snapshot m_snapshot;
    Counters m_counters;
    Clock::time_point m_now = Clock::now();
    SharedRows m_rows{{{m_tree, kStandardArc, places()}}};
};

TEST_F(SharedRowsTest, NeighboursAreEnteredAtOnce) {
    update({1000, 1001, 1002, 1016, 1017});
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1016, 1017), enters(1, 1000, 1002)));
    EXPECT_EQ(m_rows.next(), std::nullopt);
}

TEST_F(SharedRowsTest, LongRunsAreEnteredInPieces) {
    std::vector<std::uint32_t> indices;
    for (std::uint32_t index = 1000; index < 1100; ++index)
        indices.push_back(index);
    update(indices);
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1064, 1099), enters(1, 1000, 1063)));
}

TEST_F(SharedRowsTest, OnlyCellsWithAValueAreEntered) {
    update({1000, 1001, 1002, 1003}, {1001, 1003});
    EXPECT_THAT(doAll(5), ElementsAre(enters(5, 1003, 1003), enters(5, 1001, 1001)));
    update({1000, 1001, 1002, 1003}, {1001, 1002, 1003});
    EXPECT_THAT(doAll(5), ElementsAre(enters(5, 1002, 1002)));
}

TEST_F(SharedRowsTest, LastNameComesFirst) {
    update({1000, 1016}, {1000, 1016});
    std::vector<Oid> names;
    while (auto const step = m_rows.next()) {
        names.push_back(step->range.column);
        names.back().push_back(step->range.first);
        m_rows.done();
    }
    EXPECT_GT(names.size(), 4U);
    EXPECT_TRUE(std::ranges::is_sorted(names, std::greater<>()));
}

TEST_F(SharedRowsTest, OnlyTablesThatTheHostHasTooAreEntered) {
    LineRow line;
    line.ifIndex = 1000;
    m_snapshot.interfaces.lines.push_back(line);
    update({1000});
    while (auto const step = m_rows.next()) {
        EXPECT_TRUE(startsWith(step->range.column, column({2, 2, 1})));
        m_rows.done();
    }
}

TEST_F(SharedRowsTest, OneStepIsUnderWayAtATime) {
    update({1000, 1016});
    EXPECT_NE(m_rows.next(), std::nullopt);
    EXPECT_EQ(m_rows.next(), std::nullopt);
    m_rows.done();
    EXPECT_NE(m_rows.next(), std::nullopt);
}

TEST_F(SharedRowsTest, NewRowsAreEnteredBesideTheOld) {
    update({1000, 1001});
    doAll(1);
    update({1000, 1001, 1002, 1016});
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1016, 1016), enters(1, 1002, 1002)));
    update({998, 999, 1000, 1001, 1002, 1016});
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 998, 999)));
}

TEST_F(SharedRowsTest, RowsThatAreAwayForAWhileStayEntered) {
    update({1000, 1016});
    doAll(1);
    m_now += SharedRows::kKeep;
    update({1016});
    EXPECT_THAT(doAll(1), IsEmpty());
    update({1000, 1016});
    EXPECT_THAT(doAll(1), IsEmpty());
}

TEST_F(SharedRowsTest, RowsThatHaveLongBeenGoneAreTakenOut) {
    update({1000, 1001, 1016});
    doAll(1);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({1016});
    EXPECT_THAT(doAll(1), ElementsAre(leaves(1, 1000, 1001)));
    update({1000, 1001, 1016});
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1000, 1001)));
}

TEST_F(SharedRowsTest, RangeStaysWhileOneOfItsRowsIsThere) {
    update({1000, 1001, 1002});
    doAll(1);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({1001});
    EXPECT_THAT(doAll(1), IsEmpty());
}

TEST_F(SharedRowsTest, RowThatIsBackWhileItsRangeIsTakenOutIsEnteredAgain) {
    update({1000});
    doAll(1);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({});
    auto const step = m_rows.next();
    ASSERT_TRUE(step.has_value());
    EXPECT_FALSE(step->enters);
    update({1000});
    m_rows.done();
    update({1000});
    EXPECT_THAT(doAll(step->range.column.back()),
                ElementsAre(enters(step->range.column.back(), 1000, 1000)));
}

TEST_F(SharedRowsTest, RowsThatWentBeforeTheyWereEnteredAreForgotten) {
    update({1000});
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({});
    EXPECT_EQ(m_rows.next(), std::nullopt);
}

TEST_F(SharedRowsTest, RefusedRangeIsToldOncePerTableAndTheRestGoesOn) {
    update({1000, 1016});
    ::testing::internal::CaptureStderr();
    std::size_t refused = 0;
    while (auto const step = m_rows.next()) {
        m_rows.refused("another agent serves them already");
        ++refused;
    }
    std::string const told = ::testing::internal::GetCapturedStderr();
    EXPECT_EQ(refused, 2U * 2U); // ifIndex and ifDescr
    EXPECT_EQ(std::ranges::count(told, '\n'), 1) << told;
    EXPECT_THAT(told, ::testing::HasSubstr("refuses rows of ifTable, of index 1016 on: another "
                                           "agent serves them already; the rest is served"));
    update({1000, 1016});
    EXPECT_EQ(m_rows.next(), std::nullopt);
}

TEST_F(SharedRowsTest, NewMasterIsToldAll) {
    update({1000, 1016});
    doAll(1);
    update({1000, 1016, 1032});
    ASSERT_NE(m_rows.next(), std::nullopt);
    m_rows.restart();
    EXPECT_THAT(doAll(1),
                ElementsAre(enters(1, 1032, 1032), enters(1, 1016, 1016), enters(1, 1000, 1000)));
}

TEST_F(SharedRowsTest, NewMasterIsToldWhatTheLastOneRefused) {
    update({1000});
    while (m_rows.next())
        m_rows.refused("it does not allow it");
    m_rows.restart();
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1000, 1000)));
}

TEST_F(SharedRowsTest, NewMasterIsNotToldWhatHasGone) {
    update({1000, 1016});
    doAll(1);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({1016});
    ASSERT_NE(m_rows.next(), std::nullopt);
    m_rows.restart();
    EXPECT_THAT(doAll(1), ElementsAre(enters(1, 1016, 1016)));
}

TEST_F(SharedRowsTest, RefusedRemovalIsAsGoodAsDone) {
    update({1000});
    doAll(1);
    m_now += SharedRows::kKeep + std::chrono::seconds(1);
    update({});
    std::size_t steps = 0;
    while (auto const step = m_rows.next()) {
        EXPECT_FALSE(step->enters);
        m_rows.refused("fault 264");
        ++steps;
    }
    EXPECT_EQ(steps, 2U);
    update({});
    EXPECT_EQ(m_rows.next(), std::nullopt);
}

} // namespace
} // namespace kvloamd
