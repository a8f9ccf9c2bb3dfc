// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/LongCounters.h"

#include <array>
#include <chrono>
#include <vector>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

using namespace std::chrono_literals;
using Counters = std::vector<LongCounter>;

bool restarted(std::uint64_t former, std::uint64_t now, std::uint64_t limit) {
    Counters const totals{former};
    Counters const read{now};
    std::array const limits{limit};
    return hasRestarted(totals, read, limits);
}

TEST(LongCountersTest, LimitIsWhatTheSpeedAllowsAndASecondMore) {
    EXPECT_EQ(countLimits(8'000'000, 9s).octets, 10'000'000U);
    EXPECT_EQ(countLimits(8'000'000, 9s).others, 625'000U);
    EXPECT_EQ(countLimits(std::nullopt, 0s).octets, 125'000'000U);
    EXPECT_EQ(countLimits(0, 9s).octets, 0U);
}

TEST(LongCountersTest, CounterThatHasNotFallenHasNotRestarted) {
    EXPECT_FALSE(restarted(5, 5, 0));
    EXPECT_FALSE(restarted(5, 4000000000U, 0));
}

TEST(LongCountersTest, CounterThatHasFallenHasWrappedIfItCanHaveCountedThatMuch) {
    EXPECT_FALSE(restarted(4294967290U, 4, 10));
    EXPECT_TRUE(restarted(4294967290U, 5, 10));
    EXPECT_TRUE(restarted(5, 0, 1000000));
}

TEST(LongCountersTest, TotalIsComparedByItsLow32Bits) {
    EXPECT_FALSE(restarted(0x3fffffffbU, 4, 10));
    EXPECT_FALSE(restarted(0x300000001U, 2, 10));
}

TEST(LongCountersTest, CounterThatIsNotKnownHasNotRestarted) {
    Counters const known{7};
    Counters const unknown{std::nullopt};
    std::array<std::uint64_t, 1> const limits{0};
    EXPECT_FALSE(hasRestarted(known, unknown, limits));
    EXPECT_FALSE(hasRestarted(unknown, known, limits));
}

TEST(LongCountersTest, TotalsGrowByWhatHasBeenCounted) {
    Counters totals{0xfffffffaU, std::nullopt, 3};
    Counters read{4, 9, std::nullopt};
    countOn(totals, read);
    EXPECT_EQ(totals, (Counters{0x100000004U, 9, 3}));
    EXPECT_EQ(read, (Counters{0x100000004U, 9, std::nullopt}));
}

} // namespace
} // namespace kvloamd
