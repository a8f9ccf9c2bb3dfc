// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ChangeTimes.h"

#include <ctime>
#include <limits>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

class ChangeTimesTest : public ::testing::Test {
  protected:
    static long secondsNow() { return static_cast<long>(std::time(nullptr)); }

    Clock::time_point m_now = Clock::now();
    // Long ago, so that what happens now has a time that is not 0.
    ChangeTimes m_times{m_now - 1h};
};

TEST_F(ChangeTimesTest, NewLineChangedAtItsDate) {
    EXPECT_NEAR(m_times.at(1, secondsNow() - 60, m_now), 354000.0, 200);
}

TEST_F(ChangeTimesTest, DateBeforeTheStartIsZero) {
    EXPECT_EQ(m_times.at(1, secondsNow() - 7200, m_now), 0U);
    EXPECT_EQ(m_times.at(2, 0, m_now), 0U);
    EXPECT_EQ(m_times.at(3, std::numeric_limits<long>::min(), m_now), 0U);
}

TEST_F(ChangeTimesTest, DateInTheFutureIsThePresent) {
    EXPECT_NEAR(m_times.at(1, secondsNow() + 100000, m_now), 360000.0, 6000);
    EXPECT_NEAR(m_times.at(2, std::numeric_limits<long>::max(), m_now), 360000.0, 6000);
}

TEST_F(ChangeTimesTest, ChangeIsTimedBySteadyClockWhateverTheDate) {
    m_times.at(1, 1000, m_now);
    for (long const date : {secondsNow() + 100000, 5L, secondsNow() - 100000})
        EXPECT_EQ(m_times.at(1, date, m_now), 360000U) << date;
}

TEST_F(ChangeTimesTest, SameChangeHasOneTimeForEveryCaller) {
    m_times.at(1, 1000, m_now);
    EXPECT_EQ(m_times.at(1, 2000, m_now), 360000U);
    EXPECT_EQ(m_times.at(1, 2000, m_now + 5s), 360000U);
}

} // namespace
} // namespace kvloamd
