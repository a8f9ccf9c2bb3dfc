// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ChangeTimes.h"

#include <chrono>
#include <limits>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

constexpr long kChanged = 1'763'800'000;

class ChangeTimesTest : public ::testing::Test {
  protected:
    Clock::time_point const m_now{2h};
    // Long ago, so that what happens now has a time that is not 0.
    ChangeTimes m_times{m_now - 1h,
                        {[this] { return m_now; }, [] { return std::chrono::seconds(kChanged); }}};
};

TEST_F(ChangeTimesTest, NewLineChangedAtItsDate) {
    EXPECT_EQ(m_times.at(1, kChanged - 60, m_now), 354000U);
}

TEST_F(ChangeTimesTest, DateBeforeTheStartIsZero) {
    EXPECT_EQ(m_times.at(1, kChanged - 7200, m_now), 0U);
    EXPECT_EQ(m_times.at(2, 0, m_now), 0U);
    EXPECT_EQ(m_times.at(3, std::numeric_limits<long>::min(), m_now), 0U);
}

TEST_F(ChangeTimesTest, DateInTheFutureIsThePresent) {
    EXPECT_EQ(m_times.at(1, kChanged + 100000, m_now), 360000U);
    EXPECT_EQ(m_times.at(2, std::numeric_limits<long>::max(), m_now), 360000U);
}

TEST_F(ChangeTimesTest, ChangeIsTimedBySteadyClockWhateverTheDate) {
    m_times.at(1, 1000, m_now);
    for (long const date : {kChanged + 100000, 5L, kChanged - 100000})
        EXPECT_EQ(m_times.at(1, date, m_now), 360000U) << date;
}

TEST_F(ChangeTimesTest, SameChangeHasOneTimeForEveryCaller) {
    m_times.at(1, 1000, m_now);
    EXPECT_EQ(m_times.at(1, 2000, m_now), 360000U);
    EXPECT_EQ(m_times.at(1, 2000, m_now + 5s), 360000U);
}

} // namespace
} // namespace kvloamd
