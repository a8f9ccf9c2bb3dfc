// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Uptime.h"

#include <ctime>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class UptimeTest : public ::testing::Test {
  protected:
    /// The agent has run for an hour.
    Uptime const m_uptime{Clock::now() - std::chrono::hours(1)};
    long const m_date = static_cast<long>(std::time(nullptr));
};

TEST_F(UptimeTest, DateSinceTheStartIsTheTimeFromThenOn) {
    std::uint32_t const tenMinutesAgo = m_uptime.of(m_date - 600);
    EXPECT_GE(tenMinutesAgo, 299'800U);
    EXPECT_LE(tenMinutesAgo, m_uptime.now() - 59'000U);
}

TEST_F(UptimeTest, DateBeforeTheStartIsZero) {
    EXPECT_EQ(m_uptime.of(m_date - 3700), 0U);
}

TEST_F(UptimeTest, DateInTheFutureIsNotLaterThanNow) {
    std::uint32_t const tomorrow = m_uptime.of(m_date + 86'400);
    EXPECT_LE(tomorrow, m_uptime.now());
    EXPECT_GE(tomorrow, 360'000U);
}

} // namespace
} // namespace kvloamd
