// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/SettledTotals.h"

#include <algorithm>
#include <memory>
#include <numeric>
#include <random>
#include <vector>

#include <gmock/gmock.h>

#include "LinePerformance.h"
#include "board/DS1LineDevice.h"

namespace kvloamd {
namespace {

constexpr int kIntervalLength = 900;
constexpr std::size_t kHistory = 96;

LineTotals toTotals(::LineCounts const& counts) {
    return {
        counts.errorSeconds,       counts.severelyErrorSeconds,  counts.severelyErrorFramingSeconds,
        counts.unavailableSeconds, counts.controlledSlipSeconds, counts.pathCodingViolations,
        counts.lineErrorSeconds,   counts.burstyErrorSeconds,    counts.degradedMinutes,
        counts.lineCodeViolations};
}

/// A line whose seconds a test chooses, counted by the rules for DS1 lines.
class CountedHistory {
  public:
    explicit CountedHistory(LineFormat format = LineFormat::esf, FailureTimes const& times = {})
        : m_performance(format, times), m_intervals(1) {}

    void count(LineSecond const& second) {
        if (m_elapsed == kIntervalLength) close();
        auto const change = m_performance.count(second);
        ++m_elapsed;
        m_intervals.back() += change.running;
        if (m_intervals.size() > 1) m_intervals[m_intervals.size() - 2] += change.previous;
    }
    void count(LineSecond const& second, int times) {
        for (int i = 0; i < times; ++i)
            count(second);
    }
    /// A second that was not seen.
    void miss() {
        if (m_elapsed == kIntervalLength) close();
        m_performance.interrupt();
        ++m_elapsed;
    }

    /// What an agent reads now.
    LineRow row() const {
        LineRow row;
        row.history = 1;
        row.isWhole = m_elapsed > 0 && m_elapsed < kIntervalLength;
        row.intervalsClosed = static_cast<std::int64_t>(m_intervals.size()) - 1;
        row.timeElapsed = std::min(m_elapsed, kIntervalLength - 1);
        row.lineStatus =
            m_performance.unavailable() ? DS1LineStatusUnavailSigState : DS1LineStatusNoAlarm;
        row.running = toRow(m_intervals.back());
        auto closed = std::make_shared<ClosedIntervals>();
        for (auto interval = m_intervals.rbegin() + 1;
             interval != m_intervals.rend() && closed->counts.size() < kHistory; ++interval) {
            closed->counts.push_back(toRow(*interval));
            closed->valid.push_back(true);
        }
        row.closed = std::move(closed);
        return row;
    }
    /// The sum of all intervals.
    LineTotals sum() const {
        return toTotals(std::accumulate(
            m_intervals.begin(), m_intervals.end(), ::LineCounts(),
            [](::LineCounts sum, ::LineCounts const& interval) { return sum += interval; }));
    }

  private:
    void close() {
        m_performance.closeInterval();
        m_intervals.emplace_back();
        m_elapsed = 0;
    }
    static LineCounts toRow(::LineCounts const& counts) {
        LineTotals const totals = toTotals(counts);
        LineCounts row{};
        std::transform(totals.begin(), totals.end(), row.begin(),
                       [](std::int64_t count) { return static_cast<std::int32_t>(count); });
        return row;
    }

    LinePerformance m_performance;
    std::vector<::LineCounts> m_intervals; ///< from the oldest; the running one is the last
    int m_elapsed = 0;
};

LineSecond good() {
    return {};
}

LineSecond violated(std::uint32_t violations) {
    LineSecond second;
    second.pathCodeViolations = violations;
    second.lineCodeViolations = violations;
    return second;
}

LineSecond withoutSignal() {
    LineSecond second;
    second.lossOfSignal = true;
    return second;
}

class SettledTotalsTest : public ::testing::Test {
  protected:
    /// Counts seconds one by one, and reads each.
    void pass(LineSecond const& second, int times) {
        for (int i = 0; i < times; ++i) {
            m_history.count(second);
            m_now = m_totals.add(m_history.row());
        }
    }

    CountedHistory m_history;
    SettledTotals m_totals;
    LineTotals m_now{};
};

TEST_F(SettledTotalsTest, BeginAtNothingWhateverTheHistoryContains) {
    m_history.count(violated(5), 2000);
    m_now = m_totals.add(m_history.row());
    EXPECT_EQ(m_now[kErrorSeconds], 0);
    EXPECT_EQ(m_now[kLineCodeViolations], 0);
}

TEST_F(SettledTotalsTest, SecondIsCountedOnceItCannotBeTakenBack) {
    pass(good(), 40);
    pass(violated(5), 1);
    pass(good(), SettledTotals::kUnsettled - 1);
    EXPECT_EQ(m_now[kErrorSeconds], 0);
    pass(good(), 1);
    EXPECT_EQ(m_now[kErrorSeconds], 1);
    EXPECT_EQ(m_now[kPathCodingViolations], 5);
}

TEST_F(SettledTotalsTest, SeverelyErroredSecondsThatBecomeUnavailableNeverShow) {
    pass(good(), 40);
    pass(violated(1000), 10); // takes back the nine before it
    ASSERT_EQ(m_history.sum()[kUnavailableSeconds], 10);
    pass(good(), 100);
    EXPECT_EQ(m_now[kSeverelyErrorSeconds], 0);
    EXPECT_EQ(m_now[kUnavailableSeconds], 10);
}

TEST_F(SettledTotalsTest, SecondsOfALastingFailureAreCountedWhileItLasts) {
    pass(good(), 40);
    pass(withoutSignal(), 1000);
    EXPECT_EQ(m_now[kUnavailableSeconds], 1000 - SettledTotals::kUnsettled);
    EXPECT_EQ(m_now[kErrorSeconds], 0);
}

TEST_F(SettledTotalsTest, ErrorsBeforeAFailureAreSettledByIt) {
    pass(good(), 40);
    pass(violated(5), 10);
    pass(good(), 5);
    pass(withoutSignal(), 20);
    EXPECT_EQ(m_now[kErrorSeconds], 10);
}

TEST_F(SettledTotalsTest, LineThatIsFoundUnavailableCountsFromThen) {
    m_history.count(withoutSignal(), 500);
    pass(withoutSignal(), 100);
    EXPECT_LE(m_now[kUnavailableSeconds], 100);
    pass(good(), 200);
    EXPECT_LE(m_now[kUnavailableSeconds], 100 + 10); // until the failure is cleared
    EXPECT_GE(m_now[kUnavailableSeconds], 100 - SettledTotals::kUnsettled);
}

TEST_F(SettledTotalsTest, TotalOfSecondsNeverGrowsFasterThanTime) {
    pass(good(), 40);
    pass(withoutSignal(), 60);
    LineTotals before = m_now;
    for (int i = 0; i < 100; ++i) {
        pass(good(), 1);
        EXPECT_LE(m_now[kUnavailableSeconds], before[kUnavailableSeconds] + 1);
        before = m_now;
    }
    EXPECT_EQ(m_now, m_history.sum());
}

TEST_F(SettledTotalsTest, ReadingThatIsNotWholeIsIgnored) {
    pass(good(), 40);
    LineRow torn = m_history.row();
    torn.isWhole = false;
    torn.running[kErrorSeconds] = 500;
    EXPECT_EQ(m_totals.add(torn)[kErrorSeconds], 0);
    pass(good(), 100);
    EXPECT_EQ(m_now[kErrorSeconds], 0);
}

TEST_F(SettledTotalsTest, CounterThatTheLineDoesNotHaveIsNotKnown) {
    m_history.count(good(), 40);
    LineRow row = m_history.row();
    row.running[kDegradedMinutes] = -1;
    m_now = m_totals.add(row);
    EXPECT_EQ(m_now[kDegradedMinutes], kUnknownTotal);
    EXPECT_EQ(m_now[kErrorSeconds], 0);
}

TEST_F(SettledTotalsTest, NewHistoryContinuesTheTotals) {
    pass(good(), 40);
    pass(violated(5), 10);
    pass(good(), 60);
    ASSERT_EQ(m_now[kErrorSeconds], 10);
    CountedHistory fresh;
    fresh.count(violated(5), 3);
    LineRow row = fresh.row();
    row.history = 2;
    EXPECT_EQ(m_totals.add(row)[kErrorSeconds], 10);
    fresh.count(violated(5), 60);
    row = fresh.row();
    row.history = 2;
    m_totals.add(row);
    fresh.count(good(), 60);
    row = fresh.row();
    row.history = 2;
    EXPECT_GT(m_totals.add(row)[kErrorSeconds], 10);
}

TEST_F(SettledTotalsTest, LineWithoutAStatusHasTheTotalsOfItsClosedIntervals) {
    auto const read = [&] {
        LineRow row = m_history.row();
        row.lineStatus.reset();
        return m_totals.add(row);
    };
    m_history.count(good(), 40);
    read();
    m_history.count(violated(5), 100);
    EXPECT_EQ(read()[kErrorSeconds], 0);
    m_history.count(good(), kIntervalLength);
    EXPECT_EQ(read()[kErrorSeconds], 100);
}

TEST_F(SettledTotalsTest, LineThatIsPulledAndInsertedContinues) {
    AllSettledTotals all;
    LineRow row;
    auto const read = [&](LineSecond const& second, int times) {
        for (int i = 0; i < times; ++i) {
            m_history.count(second);
            row = m_history.row();
            all.add(7, row);
        }
    };
    read(good(), 40);
    read(violated(5), 3);
    read(good(), 40);
    all.rest(7);
    // The same history, as nobody can tell it from another one.
    read(good(), 40);
    EXPECT_EQ(row.totals[kErrorSeconds], 3);
}

class SettledTotalsPropertyTest : public ::testing::TestWithParam<unsigned> {
  protected:
    /// Some seconds of the line that have something in common. Calls `afterSecond` after each.
    template <class AfterSecond>
    void live(CountedHistory& history, AfterSecond const& afterSecond) {
        int const length = number(1, 45);
        int const kind = number(0, 8);
        for (int i = 0; i < length; ++i) {
            if (kind == 8 && number(0, 3) == 0)
                history.miss();
            else
                history.count(second(kind));
            afterSecond();
        }
    }

    int number(int least, int most) { return std::uniform_int_distribution(least, most)(m_random); }

  private:
    LineSecond second(int kind) {
        LineSecond second;
        switch (kind) {
        case 0:
        case 1:
            break;
        case 2:
            second = violated(static_cast<std::uint32_t>(number(0, 40)));
            break;
        case 3:
            second = violated(5000);
            break;
        case 4:
            second = withoutSignal();
            break;
        case 5:
            second.outOfFrame = true;
            second.ended.outOfFrame = number(0, 1) == 1;
            break;
        case 6:
            second.alarmIndication = true;
            break;
        default:
            second = violated(number(0, 2) == 0 ? 5000U : 0U);
            second.controlledSlips = number(0, 5) == 0 ? 1 : 0;
            second.alarmIndication = number(0, 9) == 0;
            break;
        }
        return second;
    }

    std::mt19937 m_random{GetParam()};
};

/// What a line had counted from now on, at the least: what is above that is taken back later.
std::vector<LineTotals> leastFromNowOn(std::vector<LineTotals> counted) {
    for (std::size_t i = counted.size() - 1; i > 0; --i)
        for (std::size_t counter = 0; counter < kLineCounters; ++counter)
            counted[i - 1][counter] = std::min(counted[i - 1][counter], counted[i][counter]);
    return counted;
}

TEST_P(SettledTotalsPropertyTest, TotalsNeverFallAndNeverShowWhatIsTakenBackAndMissNothing) {
    constexpr LineFormat kFormats[] = {LineFormat::esf, LineFormat::d4, LineFormat::e1,
                                       LineFormat::e1Crc};
    constexpr int kLongestPauses[] = {1, 3, 15, 70, 400};
    FailureTimes const times{
        number(FailureTimes::kShortestDeclaration, FailureTimes::kLongestDeclaration),
        number(0, FailureTimes::kLongestClearing)};
    int const longestPause = kLongestPauses[number(0, 4)];
    CountedHistory history(kFormats[number(0, 3)], times);
    history.count(good(), 40);
    SettledTotals totals;
    totals.add(history.row());        // nothing has been counted yet
    std::vector<LineTotals> counted;  // after each second
    std::vector<LineTotals> shown;    // by each reading
    std::vector<std::size_t> shownAt; // the place of its second in `counted`
    int pause = 1;
    auto const afterSecond = [&] {
        counted.push_back(history.sum());
        if (--pause > 0) return;
        pause = number(1, longestPause);
        shown.push_back(totals.add(history.row()));
        shownAt.push_back(counted.size() - 1);
    };
    for (int spell = 0; spell < 150; ++spell)
        live(history, afterSecond);
    for (int i = 0; i < 3 * std::max(longestPause, 100); ++i) {
        history.count(good());
        afterSecond();
    }
    auto const least = leastFromNowOn(counted);
    for (std::size_t i = 0; i < shown.size(); ++i) {
        for (std::size_t counter = 0; counter < kLineCounters; ++counter) {
            ASSERT_LE(shown[i][counter], least[shownAt[i]][counter])
                << "counter " << counter << " in second " << shownAt[i];
            if (i == 0) continue;
            ASSERT_GE(shown[i][counter], shown[i - 1][counter])
                << "counter " << counter << " in second " << shownAt[i];
        }
    }
    EXPECT_EQ(shown.back(), history.sum());
}

INSTANTIATE_TEST_SUITE_P(Lives, SettledTotalsPropertyTest, ::testing::Range(0U, 200U));

} // namespace
} // namespace kvloamd
