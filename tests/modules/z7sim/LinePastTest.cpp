// SPDX-License-Identifier: BSD-2-Clause
// A line that has run before its platform was loaded.
#include <array>
#include <vector>

#include <gtest/gtest.h>

#include "tests/modules/z7sim/LineFixture.h"

namespace {

class LinePastTest : public LineTest {
  protected:
    using Row = std::array<int, 10>;

    Row row(int n) {
        DS1IntervalTable& table = *m_table.get();
        return {table.GetErrorSeconds(n),
                table.GetSeverelyErrorSeconds(n),
                table.GetSeverelyErrorFramingSeconds(n),
                table.GetUnavailableSeconds(n),
                table.GetControlledSlipSeconds(n),
                table.GetPathCodingViolations(n),
                table.GetLineErrorSeconds(n),
                table.GetBurstyErrorSeconds(n),
                table.GetDegradedMinutes(n),
                table.GetLineCodeViolations(n)};
    }
    /// The running interval and the `closed` ones before it.
    std::vector<Row> history(int closed) {
        std::vector<Row> rows;
        for (int n = 0; n <= closed; ++n)
            rows.push_back(row(n));
        return rows;
    }
    static void rates(sim::Json const& perSecond) {
        sim::command({{"command", "line-rates"}, {"line", 51}, {"rates", perSecond}});
    }
};

TEST_F(LinePastTest, DayOfHistoryGoesOnAcrossARestart) {
    plugIn("type: esf, past: {hours: 24, errors: {path-violations: 1}}, "
           "errors: {path-violations: 1}");
    ASSERT_EQ(m_table->GetValidIntervals(), 95);
    ASSERT_EQ(m_table->GetTimeElapsed(), 900);
    tick(10);
    restart();
    tick(895);
    EXPECT_EQ(m_table->GetValidIntervals(), 96);
    EXPECT_EQ(m_table->GetTimeElapsed(), 5);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 5);
    for (int n = 0; n <= 95; ++n) {
        EXPECT_TRUE(isValid(n)) << n;
        EXPECT_EQ(m_table->GetPathCodingViolations(n), n == 0 ? 5 : 900) << n;
    }
}

TEST_F(LinePastTest, IsWhatLiveSecondsWouldHaveCounted) {
    plugIn("type: esf, past: {seconds: 3600, errors: {path-violations: 0.25, slips: 0.0625}, "
           "spells: [{ago: 3000, seconds: 40, alarms: [los]}, "
           "{ago: 1810, seconds: 20, errors: {path-violations: 400}}]}");
    ASSERT_EQ(m_table->GetTimeElapsed(), 900);
    ASSERT_EQ(m_table->GetValidIntervals(), 3);
    std::vector<Row> const past = history(3);

    exchange("type: esf, errors: {path-violations: 0.25, slips: 0.0625}");
    tick(600);
    alarm("los");
    tick(40);
    alarm("los", true);
    tick(1150);
    rates({{"path-violations", 400.25}});
    tick(20);
    rates({{"path-violations", 0.25}, {"slips", 0.0625}});
    tick(1790);
    EXPECT_EQ(history(3), past);
    EXPECT_EQ(m_table->GetUnavailableSeconds(3), 40);
}

TEST_F(LinePastTest, OfADayFillsTheRing) {
    plugIn("type: e1-crc, past: {hours: 24, errors: {path-violations: 0.5}}");
    EXPECT_EQ(m_table->GetValidIntervals(), 95);
    EXPECT_EQ(m_table->GetTimeElapsed(), 900);
    for (int n = 1; n <= 95; ++n)
        EXPECT_EQ(m_table->GetPathCodingViolations(n), 450) << n;
    tick();
    EXPECT_EQ(m_table->GetValidIntervals(), 96);
    EXPECT_EQ(m_table->GetPathCodingViolations(1), 450);
}

TEST_F(LinePastTest, LeavesTheLineUnavailableWhenItEndsSo) {
    plugIn("type: esf, alarms: [los], past: {seconds: 100, spells: [{ago: 20, seconds: 20, "
           "alarms: [los]}]}");
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 20);
    EXPECT_EQ(status() & DS1LineStatusUnavailSigState, DS1LineStatusUnavailSigState);
    tick();
    EXPECT_EQ(m_table->GetUnavailableSeconds(0), 21);
}

TEST_F(LinePastTest, IsFollowedByLiveSecondsWithoutASeam) {
    plugIn("type: esf, errors: {path-violations: 2}, past: {seconds: 10, errors: "
           "{path-violations: 3}}");
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 30);
    tick(2);
    EXPECT_EQ(m_table->GetTimeElapsed(), 12);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 34);
}

TEST_F(LinePastTest, IsLostWhenTheBoardStartsLongAfterIt) {
    load("type: esf, past: {seconds: 1000, errors: {path-violations: 1}}", "NAME: span-1");
    sim::set(5, "BOARD_CONDITION", 4);
    attach();
    LineClock::advance(std::chrono::seconds(61));
    start();
    EXPECT_EQ(m_table->GetValidIntervals(), 0);
    EXPECT_EQ(m_table->GetPathCodingViolations(0), 0);
    EXPECT_EQ(m_table->GetTimeElapsed(), 0);
}

TEST_F(LinePastTest, TimeBetweenItsEndAndTheBoardsStartIsMissed) {
    load("type: esf, past: {seconds: 1000, errors: {path-violations: 1}}", "NAME: span-1");
    sim::set(5, "BOARD_CONDITION", 4);
    attach();
    LineClock::advance(std::chrono::seconds(20));
    start();
    EXPECT_EQ(m_table->GetValidIntervals(), 1);
    EXPECT_TRUE(isValid(1));
    EXPECT_EQ(m_table->GetTimeElapsed(), 120);
    EXPECT_FALSE(isValid(0));
}

} // namespace
