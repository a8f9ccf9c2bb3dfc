// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/LineThresholds.h"

#include <memory>
#include <utility>
#include <vector>

#include <gtest/gtest.h>

#include "board/Interface.h"

namespace kvloamd {
namespace {

constexpr std::size_t kES = 0; // in LineCounts
constexpr std::size_t kUAS = 3;
constexpr std::size_t kCSS = 4;
constexpr std::size_t kPCV = 5;

/// A line's history by hand, looked at once a second.
class LineThresholdsTest : public ::testing::Test {
  protected:
    static LineCounts counts(int erroredSeconds) {
        LineCounts counts{};
        counts[kES] = erroredSeconds;
        return counts;
    }
    /// Closes the running interval.
    void close(bool valid = true) {
        m_closed.insert(m_closed.begin(), {m_running, valid});
        m_running = {};
        ++m_number;
        constexpr std::size_t kDay = 95;
        if (m_closed.size() > kDay) m_closed.resize(kDay);
    }
    void run(int erroredSeconds) { m_running[kES] = erroredSeconds; }
    LineRow row() const {
        LineRow row;
        row.running = m_running;
        row.history = m_history;
        row.intervalsClosed = m_number;
        auto closed = std::make_shared<ClosedIntervals>();
        for (auto const& [counts, valid] : m_closed) {
            closed->counts.push_back(counts);
            closed->valid.push_back(valid);
            for (std::size_t counter = 0; valid && counter < kLineCounters; ++counter)
                closed->total[counter] += counts[counter];
        }
        row.closed = closed;
        return row;
    }
    bool crosses(Threshold threshold) { return m_thresholds.look(m_limits, row())[threshold]; }
    bool crosses15m() { return crosses(kErroredSeconds15m); }
    bool crosses24h() { return crosses(kErroredSeconds24h); }
    void restart() { m_thresholds = {}; }

    LineLimits m_limits{};
    LineCounts m_running{};
    std::vector<std::pair<LineCounts, bool>> m_closed; ///< from the newest; whether they are valid
    int m_number = 0;
    std::uint64_t m_history = 1;
    LineThresholds m_thresholds;
};

class QuarterHourTest : public LineThresholdsTest {
  protected:
    QuarterHourTest() { m_limits[kErroredSeconds15m] = 10; }
};

TEST_F(QuarterHourTest, LimitIsCrossedWhenExactlyAsMuchHasBeenCounted) {
    run(9);
    EXPECT_FALSE(crosses15m());
    run(10);
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, CrossingLastsUntilALaterIntervalHasEndedBelow) {
    run(10);
    EXPECT_TRUE(crosses15m());
    close();
    run(9);
    EXPECT_TRUE(crosses15m()) << "its interval has ended, but none below the limit";
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, IntervalThatReachesTheLimitAgainContinuesTheCrossing) {
    run(10);
    EXPECT_TRUE(crosses15m());
    close();
    run(10);
    EXPECT_TRUE(crosses15m());
    close();
    run(0);
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, CrossingInTheLastSecondOfAnIntervalIsSeenAfterIt) {
    run(9);
    EXPECT_FALSE(crosses15m());
    run(10);
    close();
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, IntervalThatMissedDataClearsNothing) {
    run(10);
    EXPECT_TRUE(crosses15m());
    close();
    close(false);
    EXPECT_TRUE(crosses15m());
    close(false);
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, IntervalThatMissedDataCrossesByWhatIsKnown) {
    run(10);
    close(false);
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, CorrectionThatTakesTheCrossingBackLeavesItUntilTheNextIntervalEnds) {
    run(10);
    EXPECT_TRUE(crosses15m());
    run(1); // the seconds were unavailable ones
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, CorrectionOfTheClosedIntervalCrossesInIt) {
    run(9);
    close();
    EXPECT_FALSE(crosses15m());
    m_closed.front().first = counts(10);
    EXPECT_TRUE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, RestartComesToTheSameResult) {
    run(10);
    close();
    run(3);
    restart();
    EXPECT_TRUE(crosses15m());
    close();
    restart();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, RestartLooksBehindIntervalsThatMissedData) {
    run(10);
    close();
    close(false);
    close(false);
    restart();
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, IntervalsThatEndedWithoutALookAreMadeUpFor) {
    run(10);
    EXPECT_TRUE(crosses15m());
    close();
    close();
    close(false);
    EXPECT_FALSE(crosses15m()) << "one of the three was below the limit";
    run(10);
    close();
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, HigherLimitEndsTheCrossing) {
    run(10);
    EXPECT_TRUE(crosses15m());
    m_limits[kErroredSeconds15m] = 11;
    EXPECT_FALSE(crosses15m());
    m_limits[kErroredSeconds15m] = 10;
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, LowerLimitIsCrossedByWhatWasCountedBefore) {
    run(5);
    EXPECT_FALSE(crosses15m());
    m_limits[kErroredSeconds15m] = 5;
    EXPECT_TRUE(crosses15m());
}

TEST_F(QuarterHourTest, LimitOfZeroIsNone) {
    run(10);
    EXPECT_TRUE(crosses15m());
    m_limits[kErroredSeconds15m] = 0;
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, CounterThatTheLineDoesNotSupportCrossesNothing) {
    run(KVL::kNotSupported);
    EXPECT_FALSE(crosses15m());
    close();
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, AnotherHistoryForgetsTheCrossing) {
    for (int n = 0; n < 3; ++n)
        close();
    run(10);
    EXPECT_TRUE(crosses15m());
    m_closed = {};
    m_number = 0;
    m_history = 2;
    run(0);
    EXPECT_FALSE(crosses15m());
}

TEST_F(QuarterHourTest, EveryCounterHasItsOwnLimits) {
    m_limits = {};
    m_limits[kUnavailableSeconds15m] = 1;
    m_limits[kControlledSlipSeconds24h] = 2;
    m_limits[kCodeViolations15m] = 3;
    m_running[kUAS] = 1;
    m_running[kCSS] = 2;
    m_running[kPCV] = 3;
    auto const crossed = m_thresholds.look(m_limits, row());
    EXPECT_EQ(crossed.count(), 3U);
    EXPECT_TRUE(crossed[kUnavailableSeconds15m]);
    EXPECT_TRUE(crossed[kControlledSlipSeconds24h]);
    EXPECT_TRUE(crossed[kCodeViolations15m]);
}

class DayTest : public LineThresholdsTest {
  protected:
    DayTest() { m_limits[kErroredSeconds24h] = 100; }
};

TEST_F(DayTest, ClosedIntervalsAndTheRunningOneCountTogether) {
    run(60);
    close();
    run(39);
    EXPECT_FALSE(crosses24h());
    run(40);
    EXPECT_TRUE(crosses24h());
}

TEST_F(DayTest, CrossingLastsUntilTheWindowHasMovedOn) {
    run(100);
    close();
    constexpr int kOthers = 94;
    for (int n = 0; n < kOthers; ++n) {
        EXPECT_TRUE(crosses24h()) << n;
        close();
    }
    EXPECT_TRUE(crosses24h());
    close();
    EXPECT_FALSE(crosses24h());
}

TEST_F(DayTest, IntervalThatMissedDataIsNotInTheSum) {
    run(100);
    close(false);
    EXPECT_FALSE(crosses24h());
}

TEST_F(DayTest, IntervalThatMissedDataClearsNothing) {
    run(100);
    EXPECT_TRUE(crosses24h());
    close(false);
    EXPECT_TRUE(crosses24h());
    close();
    EXPECT_FALSE(crosses24h());
}

TEST_F(DayTest, CorrectionLeavesTheCrossingUntilTheIntervalEnds) {
    run(100);
    EXPECT_TRUE(crosses24h());
    run(90);
    EXPECT_TRUE(crosses24h());
    close();
    EXPECT_FALSE(crosses24h());
}

TEST_F(DayTest, RestartComesToTheSameResult) {
    run(100);
    close();
    restart();
    EXPECT_TRUE(crosses24h());
}

TEST_F(DayTest, SumThatIsNotKnownCrossesNothing) {
    LineRow line = row();
    auto closed = std::make_shared<ClosedIntervals>(*line.closed);
    closed->total[kES] = KVL::kNotSupported;
    line.closed = closed;
    line.running[kES] = 1000;
    EXPECT_FALSE(m_thresholds.look(m_limits, line)[kErroredSeconds24h]);
}

} // namespace
} // namespace kvloamd
