// SPDX-License-Identifier: BSD-2-Clause
#include "bench/Judgement.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace {

using testing::AllOf;
using testing::ContainsRegex;
using testing::HasSubstr;
using testing::Not;

constexpr Spread kSteady{2, 1.9, 2.1};

constexpr Spread kBefore{2, 2, 2};
constexpr Spread kSame{2, 1.99, 2.01};
constexpr Spread kTwice{4, 3.9, 4.1};
constexpr Spread kNoisy{2.2, 1.5, 4};

/// The judgement of a run in which "walk" takes `now` and "floor/lock pair" `floorNow`, compared
/// with one in which each took `before`.
Judgement compared(Spread const& now, Spread const& floorNow = kSame,
                   Spread const& before = kBefore) {
    Judgement judgement(Baseline{"bench",
                                 "Brand 7, 2 processors",
                                 "2026-11-22T20:00:00Z",
                                 {{"walk", before}, {"floor/lock pair", before}}});
    judgement.addTime("walk", now);
    judgement.addTime("floor/lock pair", floorNow);
    return judgement;
}

TEST(JudgementTest, RunWithoutLimitsIsWithin) {
    Judgement judgement;
    judgement.addRatio("copy", "its peer", kSteady, {});
    EXPECT_EQ(judgement.exitStatus(), kAllWithin);
    EXPECT_THAT(judgement.text(), HasSubstr("limits: 0 kept, 0 exceeded, 0 undecided"));
}

TEST(JudgementTest, KeptLimitIsWithin) {
    Judgement judgement;
    judgement.addRatio("copy", "its peer", kSteady, 2.2);
    EXPECT_EQ(judgement.exitStatus(), kAllWithin);
    EXPECT_THAT(judgement.text(),
                AllOf(ContainsRegex("copy +its peer +2.000 +1.900 to 2.100 +2.200  within"),
                      HasSubstr("limits: 1 kept, 0 exceeded, 0 undecided")));
}

TEST(JudgementTest, ExceededLimitIsToldFromAnUndecidedOne) {
    Judgement judgement;
    judgement.addRatio("copy", "its peer", kSteady, 1.8);
    judgement.addRatio("walk", "its peer", kSteady, 2.0);
    EXPECT_EQ(judgement.exitStatus(), kOver);
    EXPECT_THAT(judgement.text(),
                AllOf(ContainsRegex("copy .*OVER THE LIMIT"), ContainsRegex("walk .*undecided"),
                      HasSubstr("limits: 0 kept, 1 exceeded, 1 undecided")));
}

TEST(JudgementTest, UndecidedLimitHasAStatusOfItsOwn) {
    Judgement judgement;
    judgement.addRatio("copy", "its peer", kSteady, 2.0);
    judgement.addRatio("walk", "its peer", kSteady, 2.2);
    EXPECT_EQ(judgement.exitStatus(), kUndecided);
}

TEST(JudgementTest, BenchmarkThatMeasuredNothingCountsAsOver) {
    Judgement judgement;
    judgement.addFailure("walk", "the walk fails");
    EXPECT_TRUE(judgement.hasFailures());
    EXPECT_EQ(judgement.exitStatus(), kOver);
    EXPECT_THAT(judgement.text(), HasSubstr("walk: NOT MEASURED: the walk fails"));
}

TEST(JudgementTest, TimesAreShownInTheirUnits) {
    Judgement judgement;
    judgement.addTime("copy", {24, 23, 25});
    judgement.addTime("request", {24'000, 23'000, 25'000});
    judgement.addTime("refresh", {24e6, 23e6, 25e6});
    EXPECT_THAT(judgement.text(), AllOf(ContainsRegex("copy +24.00 ns +23.00 to 25.00"),
                                        ContainsRegex("request +24.00 us +23.00 to 25.00"),
                                        ContainsRegex("refresh +24.00 ms +23.00 to 25.00")));
}

TEST(JudgementTest, SameTimesAsInTheBaselineAreNotSlower) {
    Judgement const judgement = compared(kSame);
    EXPECT_EQ(judgement.exitStatus(), kAllWithin);
    EXPECT_THAT(judgement.text(), AllOf(ContainsRegex("walk +1.000.* not slower"),
                                        HasSubstr("baseline of 2026-11-22T20:00:00Z"),
                                        HasSubstr("since the baseline: 0 slower, 0 undecided")));
}

TEST(JudgementTest, FasterThanTheBaselineIsNotSlower) {
    EXPECT_EQ(compared({1, 0.9, 1.1}).exitStatus(), kAllWithin);
}

TEST(JudgementTest, TimeAboveTheToleranceIsSlower) {
    Judgement const judgement = compared(kTwice);
    EXPECT_EQ(judgement.exitStatus(), kSlower);
    EXPECT_THAT(judgement.text(), AllOf(ContainsRegex("walk +2.000.* SLOWER"),
                                        HasSubstr("since the baseline: 1 slower, 0 undecided")));
}

TEST(JudgementTest, NoisyTimeIsUndecided) {
    EXPECT_EQ(compared(kNoisy).exitStatus(), kUndecided);
}

TEST(JudgementTest, RangeOfTheBaselineCounts) {
    // 2.3 is over the tolerance for a median of 2, and within it for a highest time of 2.1.
    constexpr Spread kLater{2.3, 2.3, 2.3};
    constexpr Spread kFasterFloor{1.9, 1.9, 1.9};
    EXPECT_EQ(compared(kLater, kFasterFloor).exitStatus(), kSlower);
    EXPECT_EQ(compared(kLater, kFasterFloor, kSteady).exitStatus(), kUndecided);
}

TEST(JudgementTest, NothingIsSlowerWhileTheMachineItselfIs) {
    Judgement const judgement = compared(kTwice, kTwice);
    EXPECT_EQ(judgement.exitStatus(), kUndecided);
    EXPECT_THAT(judgement.text(),
                AllOf(Not(HasSubstr(" SLOWER")), HasSubstr("the machine itself is slower")));
}

TEST(JudgementTest, ExceededLimitCountsBeforeASlowerTime) {
    Judgement judgement = compared(kTwice);
    judgement.addRatio("copy", "its peer", kSteady, 1.8);
    EXPECT_EQ(judgement.exitStatus(), kOver);
}

TEST(JudgementTest, SlowerTimeCountsBeforeAnUndecidedLimit) {
    Judgement judgement = compared(kTwice);
    judgement.addRatio("copy", "its peer", kSteady, 2.0);
    EXPECT_EQ(judgement.exitStatus(), kSlower);
}

TEST(JudgementTest, NewBenchmarksAreNotCompared) {
    Judgement judgement = compared(kSame);
    judgement.addTime("new", kTwice);
    EXPECT_EQ(judgement.exitStatus(), kAllWithin);
}

} // namespace
