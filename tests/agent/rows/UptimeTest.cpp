// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/Uptime.h"

#include <chrono>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;

constexpr long kDate = 1'763'800'000;

class UptimeTest : public ::testing::Test {
  protected:
    Clock::time_point m_now{2h};
    std::chrono::milliseconds m_date = std::chrono::seconds(kDate);
    Uptime const m_uptime{m_now - 1h, {[this] { return m_now; }, [this] { return m_date; }}};
};

TEST_F(UptimeTest, DateSinceTheStartIsTheTimeFromThenOn) {
    EXPECT_EQ(m_uptime.of(kDate - 600), 300'000U);
}

TEST_F(UptimeTest, DateBeforeTheStartIsZero) {
    EXPECT_EQ(m_uptime.of(kDate - 3700), 0U);
}

TEST_F(UptimeTest, DateInTheFutureIsNow) {
    EXPECT_EQ(m_uptime.of(kDate + 86'400), 360'000U);
}

TEST_F(UptimeTest, DateIsOneOfTheClockAsItIsSetNow) {
    m_now += 10s;
    m_date += 10s + 24h;
    EXPECT_EQ(m_uptime.of(kDate + 86'400 - 600), 300'000U);
    EXPECT_EQ(m_uptime.of(kDate), 0U);
}

TEST_F(UptimeTest, ClockOfTheHostIsTheDefault) {
    Clock::time_point const before = Clock::now();
    Uptime const uptime(before - 1h);
    std::uint32_t const now = uptime.now();
    EXPECT_GE(now, 360'000U);
    EXPECT_LE(now, uptime.at(Clock::now()));
    EXPECT_EQ(uptime.of(0), 0U);
}

} // namespace
} // namespace kvloamd
