// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmTables.h"

#include <algorithm>
#include <string>

#include <gmock/gmock.h>

#include "agent/readers/Answers.h"

namespace kvloamd {
namespace {

using std::chrono::seconds;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::StartsWith;

class AlarmTablesTest : public ::testing::Test {
  protected:
    void begin(AlarmKind kind, std::uint32_t boardIndex = 1, std::uint32_t ifIndex = 1000,
               std::uint32_t number = 0) {
        Condition condition = conditionOf(kind, boardIndex, ifIndex, number);
        m_list.begin(condition, m_now);
    }
    static Condition conditionOf(AlarmKind kind, std::uint32_t boardIndex, std::uint32_t ifIndex,
                                 std::uint32_t number) {
        return {{kind, "S1", ifIndex + number}, "board S1", boardIndex, ifIndex, "why", {}};
    }
    void end(AlarmKind kind) { m_list.end(conditionOf(kind, 1, 1000, 0).key, m_now); }
    void pass(seconds time) {
        m_now.steady += time;
        m_now.date += time;
    }

    Clock::time_point const m_started = Clock::now();
    Instant m_now{m_started + seconds(10),
                  std::chrono::system_clock::time_point(seconds(1800000000))};
    std::uint32_t m_last = 0;
    AlarmList m_list{{}, [this](AlarmEvent, Alarm const&) { return ++m_last; }};
    AlarmTables m_tables{m_list, {1, 3, 9}, m_started};
};

TEST_F(AlarmTablesTest, ActiveAlarmIsARowWithItsDescription) {
    begin(AlarmKind::LineLossOfSignal);
    auto const rows = m_tables.rows();
    ASSERT_THAT(rows->alarms, SizeIs(1));
    AlarmRow const& row = rows->alarms.front();
    EXPECT_EQ(row.number, 1U);
    EXPECT_EQ(row.kind, "dsx1LossOfSignal");
    EXPECT_EQ(row.severity, 3);
    EXPECT_EQ(row.resource, "board S1");
    EXPECT_EQ(row.boardIndex, 1U);
    EXPECT_EQ(row.ifIndex, 1000U);
    EXPECT_EQ(row.raised, dateOctets(1800000000));
    EXPECT_EQ(row.times, 1U);
    EXPECT_EQ(row.text, "the line receives no signal (why)");
    EXPECT_EQ(row.state, AlarmState::Active);
}

TEST_F(AlarmTablesTest, HeldAlarmIsEnding) {
    AlarmPolicies policies;
    ASSERT_EQ(policies.configure("dsx1LossOfSignal=critical,clear=10"), "");
    m_list.apply(policies, m_now);
    begin(AlarmKind::LineLossOfSignal);
    end(AlarmKind::LineLossOfSignal);
    EXPECT_EQ(m_tables.rows()->alarms.front().state, AlarmState::Ending);
}

TEST_F(AlarmTablesTest, StandardRowNamesListDateAndNumber) {
    begin(AlarmKind::LineLossOfSignal);
    auto const rows = m_tables.rows();
    ASSERT_THAT(rows->active, SizeIs(1));
    DatedAlarmRow const& row = rows->active.front();
    std::string const date = dateOctets(1800000000);
    ASSERT_EQ(date.size(), 11U);
    EXPECT_EQ(row.place[0], 0U);
    EXPECT_EQ(row.place[1], 11U);
    EXPECT_EQ(row.place[2], static_cast<unsigned char>(date[0]));
    EXPECT_EQ(row.place[13], 1U);
    EXPECT_EQ(row.resource, (Oid{1, 3, 6, 1, 2, 1, 2, 2, 1, 1, 1000}));
    EXPECT_EQ(row.notification, (Oid{1, 3, 6, 1, 2, 1, 10, 18, 15, 0, 1}));
    EXPECT_EQ(row.specific, (Oid{1, 3, 9, 1, 1, 12, 4, 1, 2, 1}));
    EXPECT_EQ(row.description, "dsx1LossOfSignal on board S1: the line receives no signal (why)");
}

TEST_F(AlarmTablesTest, ModelPointerLeadsToARowOfTheModel) {
    begin(AlarmKind::LineLossOfSignal);
    begin(AlarmKind::BoardGone, 0, 0);
    begin(AlarmKind::PlatformFault, 1, 0, 17);
    end(AlarmKind::LineLossOfSignal);
    auto const rows = m_tables.rows();
    Oid const column{1, 3, 6, 1, 2, 1, 118, 1, 1, 2, 1, 3};
    std::vector<DatedAlarmRow> all = rows->active;
    all.insert(all.end(), rows->cleared.begin(), rows->cleared.end());
    ASSERT_THAT(all, SizeIs(3));
    for (DatedAlarmRow const& row : all)
        EXPECT_TRUE(std::ranges::any_of(rows->models, [&](AlarmModelRow const& model) {
            return joined(column, model.index()) == row.model;
        })) << row.description;
}

TEST_F(AlarmTablesTest, ResourceThatIsNotPresentHasNoName) {
    begin(AlarmKind::BoardGone, 0, 0);
    EXPECT_EQ(m_tables.rows()->active.front().resource, (Oid{0, 0}));
    begin(AlarmKind::BoardFailed, 2, 0);
    EXPECT_EQ(m_tables.rows()->active.back().resource, (Oid{1, 3, 9, 1, 1, 2, 4, 1, 2, 2}));
}

TEST_F(AlarmTablesTest, ClearedAlarmMovesToTheOtherTable) {
    begin(AlarmKind::LineLossOfSignal);
    pass(seconds(5));
    end(AlarmKind::LineLossOfSignal);
    auto const rows = m_tables.rows();
    EXPECT_THAT(rows->alarms, IsEmpty());
    EXPECT_THAT(rows->active, IsEmpty());
    EXPECT_THAT(rows->variables, IsEmpty());
    ASSERT_THAT(rows->cleared, SizeIs(1));
    EXPECT_EQ(rows->cleared.front().place, datedIndex(dateOctets(1800000005), 1));
    AlarmStatsRow const& stats = rows->stats.front();
    EXPECT_EQ(stats.current, 0U);
    EXPECT_EQ(stats.raised, 1U);
    EXPECT_EQ(stats.lastRaise, 1000U);
    EXPECT_EQ(stats.lastClear, 1500U);
}

TEST_F(AlarmTablesTest, RowsAreAscendingByIndex) {
    for (std::uint32_t number = 0; number < 50; ++number) {
        begin(AlarmKind::PlatformFault, 1, 0, number * 7919 % 65536);
        m_now.date -= seconds(number); // the host's clock may be set back
    }
    auto const rows = m_tables.rows();
    EXPECT_TRUE(std::ranges::is_sorted(rows->alarms, {}, &AlarmRow::number));
    EXPECT_TRUE(std::ranges::is_sorted(rows->active, {}, &DatedAlarmRow::place));
    EXPECT_TRUE(std::ranges::is_sorted(rows->variables, {}, &AlarmVariableRow::index));
    EXPECT_TRUE(std::ranges::is_sorted(rows->models, {}, &AlarmModelRow::index));
    EXPECT_THAT(rows->variables, SizeIs(150));
}

TEST_F(AlarmTablesTest, RowsAreMadeAgainOnlyWhenAlarmsHaveChanged) {
    begin(AlarmKind::LineLossOfSignal);
    auto const rows = m_tables.rows();
    EXPECT_EQ(m_tables.rows(), rows);
    end(AlarmKind::LineLossOfSignal);
    EXPECT_NE(m_tables.rows(), rows);
}

TEST_F(AlarmTablesTest, OverriddenSeverityIsInTheModel) {
    AlarmPolicies policies;
    ASSERT_EQ(policies.configure("linkDown=minor"), "");
    m_list.apply(policies, m_now);
    auto const rows = m_tables.rows();
    auto const row = std::ranges::find_if(rows->models, [](AlarmModelRow const& model) {
        return model.model == 40 && model.state != 1;
    });
    ASSERT_NE(row, rows->models.end());
    EXPECT_EQ(row->state, 4U);
    EXPECT_THAT(row->description, StartsWith("linkDown (minor): "));
    EXPECT_EQ(rows->modelChange, 1000U);
}

TEST_F(AlarmTablesTest, TotalsHaveEveryKindAndGrowWithoutOtherRows) {
    begin(AlarmKind::LineLossOfSignal);
    begin(AlarmKind::LineLossOfSignal, 1, 1001);
    auto const rows = m_tables.rows();
    EXPECT_EQ(rows->totals.size(), alarmKinds().size());
    auto const total = std::ranges::find(rows->totals, "dsx1LossOfSignal", &AlarmTotalRow::kind);
    ASSERT_NE(total, rows->totals.end());
    EXPECT_EQ(total->raised, 2U);
    EXPECT_EQ(total->active, 2U);
    EXPECT_EQ(total->lastedAt(m_now.steady), seconds(0));
    EXPECT_EQ(total->lastedAt(m_now.steady + seconds(3)), seconds(6));
    auto const other = std::ranges::find(rows->totals, "boardGone", &AlarmTotalRow::kind);
    ASSERT_NE(other, rows->totals.end());
    EXPECT_EQ(other->lastedAt(m_now.steady + seconds(3)), seconds(0));
}

} // namespace
} // namespace kvloamd
