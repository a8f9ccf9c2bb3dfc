// SPDX-License-Identifier: BSD-2-Clause
// A line's performance history, ticked only by the test.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "board/DS1IntervalTable.h"
#include "core/ReferenceCounter.h"
#include "tests/board/DrivenScheduler.h"
#include "tests/support/Slots.h"

namespace {

/// Records which operations a tick calls.
class Table final : public DS1IntervalTable {
  public:
    int GetControlledSlipSeconds(int n) override { return interval(n)->ControlledSlipSeconds; }
    int GetDegradedMinutes(int n) override { return interval(n)->DegradedMinutes; }
    int CollectSecond() override {
        m_asked += "collect ";
        return 7;
    }
    int CloseInterval() override {
        m_asked += "close ";
        return 7;
    }

    using DS1IntervalTable::GetTrueIndex;
    using DS1IntervalTable::interval;

    /// Closes intervals until `count` are closed, the k-th with k error seconds.
    void archiveUntil(int count) {
        while (m_archived < count) {
            DS1Interval closed;
            closed.ErrorSeconds = ++m_archived;
            EXPECT_EQ(ArchiveInterval(closed), 0);
        }
    }
    void archive(DS1Interval const& closed) { ArchiveInterval(closed); }
    void setTimeElapsed(int seconds) { m_timeElapsed = seconds; }
    DS1Interval& current() { return m_current; }
    std::string const& asked() const { return m_asked; }

  private:
    int m_archived = 0;
    std::string m_asked;
};

class DS1IntervalTableTest : public testing::Test {
  protected:
    /// The error seconds of the intervals 1 to 96.
    std::vector<int> history() {
        std::vector<int> seconds;
        for (int n = 1; n <= 96; ++n)
            seconds.push_back(m_table.GetErrorSeconds(n));
        return seconds;
    }
    /// `first` and what follows it downwards to `last`, then zeros up to 96 in all.
    static std::vector<int> downwards(int first, int last) {
        std::vector<int> seconds;
        for (int value = first; value >= last; --value)
            seconds.push_back(value);
        seconds.resize(96, 0);
        return seconds;
    }

    DrivenScheduler& m_scheduler = DrivenScheduler::install();
    ReferenceCounter<Table> m_handle{new Table};
    Table& m_table = *m_handle.get();
};

using Reader = int (DS1IntervalTable::*)(int);

constexpr Reader kReaders[] = {
    &DS1IntervalTable::GetErrorSeconds,
    &DS1IntervalTable::GetSeverelyErrorSeconds,
    &DS1IntervalTable::GetSeverelyErrorFramingSeconds,
    &DS1IntervalTable::GetUnavailableSeconds,
    &DS1IntervalTable::GetControlledSlipSeconds,
    &DS1IntervalTable::GetPathCodingViolations,
    &DS1IntervalTable::GetLineErrorSeconds,
    &DS1IntervalTable::GetBurstyErrorSeconds,
    &DS1IntervalTable::GetDegradedMinutes,
    &DS1IntervalTable::GetLineCodeViolations,
};

/// The record with 1 to 10 in its fields, in their order.
DS1Interval numbered() {
    return {1, 2, 3, 4, 5, 6, 7, 8, 9, 10};
}

TEST_F(DS1IntervalTableTest, NewTableReadsZeroEverywhere) {
    EXPECT_EQ(m_table.GetTimeElapsed(), 0);
    EXPECT_EQ(m_table.GetValidIntervals(), 0);
    for (int n = 0; n <= 96; ++n)
        for (Reader const reader : kReaders)
            EXPECT_EQ((m_table.*reader)(n), 0) << n;
}

TEST_F(DS1IntervalTableTest, ClosedIntervalsAreReadFromTheLastToTheFirst) {
    for (int const closed : {1, 50, 95}) {
        m_table.archiveUntil(closed);
        EXPECT_EQ(m_table.GetValidIntervals(), closed);
        EXPECT_EQ(history(), downwards(closed, 1));
    }
}

TEST_F(DS1IntervalTableTest, FullRingIsValidWholeButItsOldestIntervalReadsZero) {
    m_table.archiveUntil(96);
    EXPECT_EQ(m_table.GetValidIntervals(), 96);
    EXPECT_EQ(history(), downwards(96, 2));
}

TEST_F(DS1IntervalTableTest, EveryFurtherIntervalDropsTheOldestOne) {
    m_table.archiveUntil(97);
    EXPECT_EQ(m_table.GetValidIntervals(), 96);
    EXPECT_EQ(history(), downwards(97, 3));
}

TEST_F(DS1IntervalTableTest, RingGoesRoundManyTimes) {
    m_table.archiveUntil(1000);
    EXPECT_EQ(m_table.GetValidIntervals(), 96);
    EXPECT_EQ(history(), downwards(1000, 906));
}

TEST_F(DS1IntervalTableTest, ClosingAnIntervalResetsTheTimeElapsed) {
    for (int const seconds : {0, 1, 450, 900, 5000}) {
        m_table.setTimeElapsed(seconds);
        EXPECT_EQ(m_table.GetTimeElapsed(), seconds);
        m_table.archive(DS1Interval());
        EXPECT_EQ(m_table.GetTimeElapsed(), 0);
    }
}

TEST_F(DS1IntervalTableTest, ClosingAnIntervalLeavesTheRunningOne) {
    m_table.current().ErrorSeconds = 12;
    m_table.archive(DS1Interval());
    EXPECT_EQ(m_table.GetErrorSeconds(0), 12);
}

TEST_F(DS1IntervalTableTest, TickCollectsASecondWhileTheIntervalLasts) {
    for (int const elapsed : {0, 1, 899}) {
        m_table.setTimeElapsed(elapsed);
        EXPECT_EQ(m_table.ScheduledAction(), 0);
    }
    EXPECT_EQ(m_table.asked(), "collect collect collect ");
}

TEST_F(DS1IntervalTableTest, TickClosesACompleteInterval) {
    m_table.setTimeElapsed(900);
    EXPECT_EQ(m_table.ScheduledAction(), 0);
    EXPECT_EQ(m_table.asked(), "close ");
}

TEST_F(DS1IntervalTableTest, TickItselfCountsNoTime) {
    m_table.setTimeElapsed(10);
    m_table.ScheduledAction();
    EXPECT_EQ(m_table.GetTimeElapsed(), 10);
}

TEST_F(DS1IntervalTableTest, PositionZeroReadsTheRunningInterval) {
    m_table.archiveUntil(3);
    m_table.current() = numbered();
    EXPECT_EQ(m_table.GetErrorSeconds(0), 1);
    EXPECT_EQ(m_table.GetErrorSeconds(1), 3);
}

TEST_F(DS1IntervalTableTest, PositionOutsideTheRingReadsZero) {
    m_table.archiveUntil(96);
    for (int const n : {97, 98, 150, 191}) {
        EXPECT_EQ(m_table.interval(n), nullptr) << n;
        EXPECT_EQ(m_table.GetErrorSeconds(n), 0) << n;
    }
}

TEST_F(DS1IntervalTableTest, PlaceInTheRingIsCountedBackFromTheNextOne) {
    EXPECT_EQ(m_table.GetTrueIndex(1), 95);
    EXPECT_EQ(m_table.GetTrueIndex(96), 0);
    m_table.archiveUntil(10);
    EXPECT_EQ(m_table.GetTrueIndex(1), 9);
    EXPECT_EQ(m_table.GetTrueIndex(10), 0);
    EXPECT_EQ(m_table.GetTrueIndex(11), 95);
}

TEST_F(DS1IntervalTableTest, EveryReaderReadsItsOwnFieldOfTheRunningInterval) {
    m_table.current() = numbered();
    for (int i = 0; i < 10; ++i)
        EXPECT_EQ((m_table.*kReaders[i])(0), i + 1) << i;
}

TEST_F(DS1IntervalTableTest, EveryReaderReadsItsOwnFieldOfAClosedInterval) {
    m_table.archive(numbered());
    for (int i = 0; i < 10; ++i)
        EXPECT_EQ((m_table.*kReaders[i])(1), i + 1) << i;
}

TEST_F(DS1IntervalTableTest, TableIsOnTheSchedulersListFromItsConstruction) {
    EXPECT_EQ(m_scheduler.AddPeriodic(&m_table, 1), 1);
    EXPECT_EQ(m_scheduler.Remove(&m_table), 0);
}

TEST_F(DS1IntervalTableTest, TableIsOffTheSchedulersListOnceItIsGone) {
    Schedulable* const entry = &m_table;
    m_handle = {};
    EXPECT_EQ(m_scheduler.Remove(entry), 1);
}

TEST_F(DS1IntervalTableTest, SchedulerTicksTheTableEverySecond) {
    m_scheduler.passSeconds(3);
    EXPECT_EQ(m_table.asked(), "collect collect collect ");
}

TEST_F(DS1IntervalTableTest, TableWithoutAHandleIsNotTicked) {
    Table table;
    table.ScheduledAction();
    m_scheduler.passSeconds(1);
    EXPECT_EQ(table.asked(), "");
}

TEST_F(DS1IntervalTableTest, RecordIsTenCountersOfFourBytes) {
    EXPECT_EQ(sizeof(DS1Counter), 4U);
    EXPECT_EQ(sizeof(DS1Interval), 40U);
}

TEST_F(DS1IntervalTableTest, CounterBehavesLikeItsNumber) {
    DS1Counter counter;
    EXPECT_EQ(counter, 0);
    counter = 5;
    counter += 3;
    DS1Counter copy(counter);
    counter = copy += 1;
    EXPECT_EQ(counter, 9);
    EXPECT_EQ(copy, 9);
}

TEST_F(DS1IntervalTableTest, OperationsKeepTheirSlots) {
    int slot = 2;
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetTimeElapsed), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetValidIntervals), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetErrorSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetSeverelyErrorSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetSeverelyErrorFramingSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetUnavailableSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetPathCodingViolations), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetLineErrorSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetBurstyErrorSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetLineCodeViolations), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetControlledSlipSeconds), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::GetDegradedMinutes), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::ScheduledAction), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::CollectSecond), slot++);
    EXPECT_EQ(slotOf(&DS1IntervalTable::CloseInterval), slot++);
}

} // namespace
