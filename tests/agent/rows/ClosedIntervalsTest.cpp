// SPDX-License-Identifier: BSD-2-Clause
// The packed counters of closed intervals.
#include "agent/rows/ClosedIntervals.h"

#include <cstdint>
#include <limits>
#include <random>
#include <vector>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

constexpr std::size_t kDay = 96;

TEST(PackedCountsTest, NewListIsEmpty) {
    PackedCounts const counts;
    EXPECT_TRUE(counts.empty());
    EXPECT_EQ(counts.size(), 0U);
}

TEST(PackedCountsTest, IntervalsComeBackInTheirOrder) {
    PackedCounts const counts{{1, 2, 3}, {}, {0, 0, 0, 900, 0, 0, 0, 0, 0, 7}};
    ASSERT_EQ(counts.size(), 3U);
    EXPECT_EQ(counts.front(), (LineCounts{1, 2, 3}));
    EXPECT_EQ(counts[1], LineCounts{});
    EXPECT_EQ(counts[2], (LineCounts{0, 0, 0, 900, 0, 0, 0, 0, 0, 7}));
}

TEST(PackedCountsTest, CountersOfEveryValueComeBack) {
    std::vector<std::int32_t> values{0, -1, 1, std::numeric_limits<std::int32_t>::min(),
                                     std::numeric_limits<std::int32_t>::max()};
    // What needs a byte more than the value before.
    for (unsigned bits = 6; bits < 31; ++bits)
        for (std::int32_t const near : {-1, 0, 1})
            for (std::int32_t const sign : {-1, 1})
                values.push_back(sign * ((1 << bits) + near));
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        for (std::int32_t const value : values) {
            LineCounts counts{};
            counts[counter] = value;
            PackedCounts const packed{{5}, counts, {6}};
            EXPECT_EQ(packed[1], counts) << value << " as counter " << counter;
            EXPECT_EQ(packed[2], LineCounts{6});
        }
}

TEST(PackedCountsTest, DayOfTheLargestCountersComesBack) {
    LineCounts largest{};
    largest.fill(std::numeric_limits<std::int32_t>::min());
    PackedCounts packed;
    for (std::size_t n = 0; n < kDay; ++n)
        packed.push_back(largest);
    packed.shrink_to_fit();
    for (std::size_t n = 0; n < kDay; ++n)
        EXPECT_EQ(packed[n], largest) << n;
}

TEST(PackedCountsTest, RandomDaysComeBack) {
    std::mt19937 random(1);
    for (int round = 0; round < 200; ++round) {
        std::vector<LineCounts> day(random() % (kDay + 1));
        for (LineCounts& counts : day)
            for (std::int32_t& count : counts)
                if (random() % 3 != 0) count = static_cast<std::int32_t>(random() >> random() % 32);
        PackedCounts packed;
        for (LineCounts const& counts : day)
            packed.push_back(counts);
        packed.shrink_to_fit();
        ASSERT_EQ(packed.size(), day.size());
        for (std::size_t n = 0; n < day.size(); ++n)
            ASSERT_EQ(packed[n], day[n]) << "round " << round << ", interval " << n;
    }
}

} // namespace
} // namespace kvloamd
