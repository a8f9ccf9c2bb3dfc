// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/LineHistories.h"

#include <memory>

#include <gmock/gmock.h>

#include "tests/support/FakeLines.h"

namespace kvloamd {
namespace {

using ::testing::IsEmpty;
using ::testing::SizeIs;

class LineHistoriesTest : public ::testing::Test {
  protected:
    /// What the line tells a while after the last reading.
    LineRow read(std::chrono::seconds later = std::chrono::seconds(1)) {
        m_now += later;
        m_histories.begin(m_now);
        LineRow row;
        m_histories.read(m_table, row);
        return row;
    }

    FakeHistory* m_history = new FakeHistory;
    ReferenceCounter<DS1IntervalTable> m_table{m_history};
    LineHistories m_histories;
    Clock::time_point m_now{std::chrono::hours(1)};
};

TEST_F(LineHistoriesTest, RunningIntervalIsReadEveryTime) {
    m_history->run(1, 100);
    EXPECT_EQ(read().running[0], 1);
    m_history->run(2, 101);
    LineRow const row = read();
    EXPECT_EQ(row.running[0], 2);
    EXPECT_EQ(row.timeElapsed, 101);
    EXPECT_THAT(row.closed->counts, IsEmpty());
}

TEST_F(LineHistoriesTest, ClosedIntervalsAreSharedWhileNoneIsClosed) {
    m_history->close(5);
    m_history->run(0, 100);
    LineRow const before = read();
    m_history->run(0, 101);
    LineRow const after = read();
    ASSERT_THAT(after.closed->counts, SizeIs(1));
    EXPECT_EQ(after.closed, before.closed);
}

TEST_F(LineHistoriesTest, IntervalThatHasBeenClosedIsRead) {
    m_history->close(5);
    m_history->run(0, 899);
    read();
    m_history->close(7);
    m_history->run(0, 1);
    LineRow const row = read();
    ASSERT_THAT(row.closed->counts, SizeIs(2));
    EXPECT_EQ(row.closed->counts[0][0], 7);
    EXPECT_EQ(row.closed->counts[1][0], 5);
    EXPECT_EQ(row.closed->total[0], 12);
}

TEST_F(LineHistoriesTest, IntervalThatIsClosedWhileTheHistoryIsFullIsRead) {
    for (int n = 0; n <= DS1IntervalTable::kIntervals; ++n)
        m_history->close(5);
    m_history->run(0, 899);
    read();
    m_history->close(7);
    m_history->run(0, 1);
    LineRow const row = read();
    ASSERT_THAT(row.closed->counts, SizeIs(DS1IntervalTable::kIntervals));
    EXPECT_EQ(row.closed->counts[0][0], 7);
    EXPECT_EQ(row.closed->counts[1][0], 5);
}

TEST_F(LineHistoriesTest, NewestClosedIntervalMayBeCorrectedForAWhile) {
    m_history->close(5);
    m_history->run(0, 5);
    read();
    m_history->correctNewest(3);
    m_history->run(0, 6);
    LineRow const row = read();
    EXPECT_EQ(row.closed->counts[0][0], 3);
    EXPECT_EQ(row.closed->total[0], 3);
}

TEST_F(LineHistoriesTest, EverythingIsReadAfterALongPause) {
    for (int n = 0; n <= DS1IntervalTable::kIntervals; ++n)
        m_history->close(5);
    m_history->run(0, 100);
    read();
    // An interval later the time elapsed looks as if none had been closed.
    m_history->close(7);
    m_history->run(0, 101);
    EXPECT_EQ(read(std::chrono::seconds(901)).closed->counts[0][0], 7);
}

TEST_F(LineHistoriesTest, TableThatDoesNotTellTheTimeIsReadEveryTime) {
    m_history->close(5);
    read();
    m_history->correctNewest(3);
    EXPECT_EQ(read().closed->counts[0][0], 3);
}

TEST_F(LineHistoriesTest, ReadingIsNotWholeWhileAnIntervalIsBeingClosed) {
    m_history->run(1, 100);
    EXPECT_TRUE(read().isWhole);
    m_history->run(1, DS1IntervalTable::kIntervalLength);
    EXPECT_FALSE(read().isWhole);
    m_history->run(1, 0);
    EXPECT_FALSE(read().isWhole);
}

TEST_F(LineHistoriesTest, ClosedIntervalsAreCountedByTheTimeThatHasPassed) {
    m_history->run(0, 890);
    EXPECT_EQ(read().intervalsClosed, 0);
    m_history->run(0, 10);
    EXPECT_EQ(read(std::chrono::seconds(20)).intervalsClosed, 1);
    m_history->run(0, 9);
    EXPECT_EQ(read(std::chrono::seconds(1800)).intervalsClosed, 3);
    EXPECT_EQ(read(std::chrono::seconds(1)).intervalsClosed, 3);
}

TEST_F(LineHistoriesTest, AnotherTableHasAnotherNumber) {
    m_history->run(0, 100);
    std::uint64_t const first = read().history;
    EXPECT_NE(first, 0U);
    EXPECT_EQ(read().history, first);
    m_table = ReferenceCounter<DS1IntervalTable>(new FakeHistory);
    EXPECT_NE(read().history, first);
}

class GapsTest : public LineHistoriesTest {
  protected:
    GapsTest() { m_table = ReferenceCounter<DS1IntervalTable>(m_gaps); }

    FakeHistoryWithGaps* m_gaps = new FakeHistoryWithGaps;
};

TEST_F(LineHistoriesTest, IntervalsOfATableThatMissesNothingAreValidExceptForTheEmptyOne) {
    for (int n = 0; n <= DS1IntervalTable::kIntervals; ++n)
        m_history->close(5);
    LineRow const row = read();
    EXPECT_TRUE(row.isValid(1));
    EXPECT_TRUE(row.isValid(95));
    EXPECT_FALSE(row.isValid(96));
    EXPECT_EQ(row.closed->total[0], 95 * 5);
}

TEST_F(GapsTest, IntervalThatMissedDataIsNeitherValidNorInTheTotals) {
    m_gaps->close(5);
    m_gaps->close(7);
    m_gaps->close(11);
    m_gaps->invalid = {2};
    LineRow const row = read();
    EXPECT_TRUE(row.isValid(1));
    EXPECT_FALSE(row.isValid(2));
    EXPECT_TRUE(row.isValid(3));
    EXPECT_EQ(row.closed->total[0], 16);
}

TEST_F(GapsTest, IntervalsClosedAtOnceAreReadWhateverTheTimeElapsedSays) {
    for (int n = 0; n <= DS1IntervalTable::kIntervals; ++n)
        m_gaps->close(5);
    m_gaps->run(0, 100);
    read();
    // A host that was suspended finds intervals closed which nobody saw running.
    m_gaps->close(0);
    m_gaps->closed = 1;
    m_gaps->invalid = {1};
    m_gaps->run(0, 101);
    LineRow const row = read();
    EXPECT_FALSE(row.isValid(1));
    EXPECT_EQ(row.closed->counts[0][0], 0);
}

TEST_F(LineHistoriesTest, TableThatIsReadNoMoreIsLetGo) {
    read();
    m_histories.begin(m_now += std::chrono::seconds(1));
    m_histories.begin(m_now += std::chrono::seconds(1));
    std::weak_ptr<int> const alive = m_history->alive;
    m_table = ReferenceCounter<DS1IntervalTable>();
    EXPECT_TRUE(alive.expired());
}

} // namespace
} // namespace kvloamd
