// SPDX-License-Identifier: BSD-2-Clause
#include "bench/Verdict.h"

#include <algorithm>
#include <cmath>
#include <limits>
#include <numeric>
#include <stdexcept>
#include <vector>

#include <gtest/gtest.h>

namespace {

/// 1, 2, 3 and so on, the last first.
std::vector<double> upTo(int count) {
    std::vector<double> values(static_cast<std::size_t>(count));
    std::iota(values.rbegin(), values.rend(), 1.0);
    return values;
}

TEST(VerdictTest, MedianOfAnOddNumberIsTheMiddleOne) {
    EXPECT_EQ(spreadOf({9, 1, 2}).median, 2);
}

TEST(VerdictTest, MedianOfAnEvenNumberIsHalfwayBetweenTheMiddleOnes) {
    EXPECT_EQ(spreadOf({9, 1, 2, 4}).median, 3);
}

TEST(VerdictTest, SpreadOfFewValuesContainsAllOfThem) {
    Spread const spread = spreadOf({5, 1, 3, 2, 4});
    EXPECT_EQ(spread.low, 1);
    EXPECT_EQ(spread.high, 5);
}

TEST(VerdictTest, SpreadOfNineValuesLeavesOneOutAtEachEnd) {
    Spread const spread = spreadOf(upTo(9));
    EXPECT_EQ(spread.low, 2);
    EXPECT_EQ(spread.high, 8);
}

// The ranks of the sign test's 95 % interval, as statistical tables have them.
TEST(VerdictTest, RanksOfTheSpreadAreThoseOfTheSignTest) {
    struct Ranks {
        int count;
        double low;
    };
    for (Ranks const ranks : {Ranks{6, 1}, {8, 1}, {11, 2}, {12, 3}, {15, 4}, {20, 6}, {25, 8}}) {
        Spread const spread = spreadOf(upTo(ranks.count));
        EXPECT_EQ(spread.low, ranks.low) << ranks.count;
        EXPECT_EQ(spread.high, ranks.count + 1 - ranks.low) << ranks.count;
    }
}

TEST(VerdictTest, ThousandsOfValuesHaveASpread) {
    Spread const spread = spreadOf(upTo(10'001));
    EXPECT_EQ(spread.median, 5001);
    // 1.96 standard deviations of 50 around the middle
    EXPECT_NEAR(spread.low, 5001 - 98, 2);
    EXPECT_NEAR(spread.high, 5001 + 98, 2);
}

TEST(VerdictTest, OneOutlierOfNineDoesNotWidenTheSpread) {
    EXPECT_EQ(spreadOf({1, 1, 1, 1, 1, 1, 1, 1, 1000}).high, 1);
}

TEST(VerdictTest, EqualValuesHaveASpreadOfNothing) {
    Spread const spread = spreadOf({7, 7, 7});
    EXPECT_EQ(spread.low, 7);
    EXPECT_EQ(spread.high, 7);
}

TEST(VerdictTest, SingleValueHasAnInfiniteSpread) {
    Spread const spread = spreadOf({7});
    EXPECT_EQ(spread.median, 7);
    EXPECT_EQ(spread.low, 0);
    EXPECT_TRUE(std::isinf(spread.high));
}

TEST(VerdictTest, NoValuesHaveNoSpread) {
    EXPECT_THROW(spreadOf({}), std::invalid_argument);
}

TEST(VerdictTest, RangeBelowTheLimitIsWithin) {
    EXPECT_EQ(decide({2, 1, 3}, 3.5), Verdict::Within);
}

TEST(VerdictTest, RangeThatTouchesTheLimitIsWithin) {
    EXPECT_EQ(decide({2, 1, 3}, 3), Verdict::Within);
}

TEST(VerdictTest, RangeAboveTheLimitIsOver) {
    EXPECT_EQ(decide({2, 1, 3}, 0.5), Verdict::Over);
}

TEST(VerdictTest, LimitBelowTheMedianInsideTheRangeIsUndecided) {
    EXPECT_EQ(decide({2, 1, 3}, 1.5), Verdict::Undecided);
}

TEST(VerdictTest, LimitAboveTheMedianInsideTheRangeIsUndecided) {
    EXPECT_EQ(decide({2, 1, 3}, 2.5), Verdict::Undecided);
}

TEST(VerdictTest, SingleValueDecidesNothing) {
    EXPECT_EQ(decide(spreadOf({7}), 1000), Verdict::Undecided);
    EXPECT_EQ(decide(spreadOf({7}), 0.001), Verdict::Undecided);
}

TEST(VerdictTest, RatioGoesFromTheLowestToTheHighestPossible) {
    Spread const ratio = ratioOf({6, 4, 8}, {2, 1, 4});
    EXPECT_EQ(ratio.median, 3);
    EXPECT_EQ(ratio.low, 1);
    EXPECT_EQ(ratio.high, 8);
}

} // namespace
