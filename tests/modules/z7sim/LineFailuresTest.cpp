// SPDX-License-Identifier: BSD-2-Clause
// Failures of a line, and the time that they make unavailable: each rule once, worked out by hand.
#include <initializer_list>

#include <gtest/gtest.h>

#include "LinePerformance.h"
#include "tests/modules/z7sim/CountedLine.h"

namespace {

constexpr auto kFormats = {LineFormat::esf, LineFormat::d4, LineFormat::e1, LineFormat::e1Crc};
constexpr LineSecond kClean;
constexpr LineSecond kNoSignal{.lossOfSignal = true};
constexpr LineSecond kNoFrame{.outOfFrame = true};
constexpr LineSecond kIndication{.outOfFrame = true, .alarmIndication = true};
constexpr LineSecond kSignalIsBack{.lossOfSignal = true, .ended = {.lossOfSignal = true}};
/// Severely errored in every format, without a defect.
constexpr LineSecond kSevere{
    .lineCodeViolations = 2048, .pathCodeViolations = 832, .framingErrors = 1};

LineCounts unavailableSeconds(int n) {
    return {.unavailableSeconds = n};
}

TEST(LineFailuresTest, DefectIsAFailureOnceTwoWholeSecondsHaveFollowedItsOnset) {
    for (auto format : kFormats) {
        CountedLine line(format);
        line.count(kNoSignal, 2);
        EXPECT_EQ(line.failures(), LineDefects());
        line.count(kNoSignal);
        EXPECT_TRUE(line.failures().lossOfSignal);
    }
}

TEST(LineFailuresTest, DefectThatEndsWithinTheDecidingSecondIsNoFailure) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 2);
    line.count(kSignalIsBack);
    EXPECT_EQ(line.failures(), LineDefects());
    // The next one begins anew.
    line.count(kNoSignal, 2);
    EXPECT_EQ(line.failures(), LineDefects());
    line.count(kNoSignal);
    EXPECT_TRUE(line.failures().lossOfSignal);
}

TEST(LineFailuresTest, LineWithoutSignalHasNoFrameEither) {
    CountedLine line(LineFormat::e1Crc);
    line.count(kNoSignal, 3);
    EXPECT_EQ(line.failures(), (LineDefects{.lossOfSignal = true, .outOfFrame = true}));
}

TEST(LineFailuresTest, ReceivedAlarmIndicationIsAFailureBesideTheLossOfFrame) {
    CountedLine line(LineFormat::e1);
    line.count(kIndication, 3);
    EXPECT_EQ(line.failures(), (LineDefects{.outOfFrame = true, .alarmIndication = true}));
}

TEST(LineFailuresTest, SignalThatComesAndGoesLeavesTheFrameLost) {
    // The signal is back in the second in which the frame is still missing.
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal);
    line.count({.lossOfSignal = true, .outOfFrame = true, .ended = {.lossOfSignal = true}});
    line.count(kNoFrame);
    EXPECT_EQ(line.failures(), LineDefects{.outOfFrame = true});
}

TEST(LineFailuresTest, FailureEndsWithTheTenthSecondWithoutItsDefect) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 5);
    line.count(kClean, 9);
    EXPECT_TRUE(line.failures().lossOfSignal);
    line.count(kClean);
    EXPECT_EQ(line.failures(), LineDefects());
}

TEST(LineFailuresTest, DefectThatReturnsKeepsTheFailure) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 5);
    line.count(kClean, 9);
    line.count(kSignalIsBack);
    line.count(kClean, 9);
    EXPECT_TRUE(line.failures().lossOfSignal);
    line.count(kClean);
    EXPECT_EQ(line.failures(), LineDefects());
}

TEST(LineFailuresTest, FiveSecondsWithoutSignalAreFiveUnavailableOnesAndNothingElse) {
    for (auto format : kFormats) {
        CountedLine line(format);
        line.count(kNoSignal, 5);
        EXPECT_EQ(line.running(), unavailableSeconds(5));
        line.count(kClean, 20);
        EXPECT_EQ(line.running(), unavailableSeconds(5));
        EXPECT_FALSE(line.unavailable());
    }
}

TEST(LineFailuresTest, DefectTooShortForAFailureCountsErroredSeconds) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 2);
    line.count(kClean, 20);
    EXPECT_EQ(line.running(),
              (LineCounts{
                  .errorSeconds = 2, .severelyErrorSeconds = 2, .severelyErrorFramingSeconds = 2}));
    CountedLine e1(LineFormat::e1);
    e1.count(kNoFrame, 2);
    e1.count(kClean, 20);
    EXPECT_EQ(e1.running(), (LineCounts{.errorSeconds = 2, .severelyErrorFramingSeconds = 2}));
}

TEST(LineFailuresTest, SevereSecondsDirectlyBeforeTheDefectAreUnavailableToo) {
    for (auto format : kFormats) {
        CountedLine line(format);
        line.count(kSevere, 4);
        line.count(kNoSignal, 2);
        EXPECT_EQ(line.running().unavailableSeconds, 0);
        line.count(kNoSignal);
        EXPECT_EQ(line.running(), unavailableSeconds(7));
    }
}

TEST(LineFailuresTest, SevereSecondsFurtherBeforeTheDefectStay) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 4);
    line.count(kClean);
    line.count(kNoSignal, 3);
    EXPECT_EQ(line.running().severelyErrorSeconds, 4);
    EXPECT_EQ(line.running().unavailableSeconds, 3);
}

TEST(LineFailuresTest, LossOfFrameOfAnE1WithoutCrcIsUnavailableThoughNeverSevere) {
    CountedLine line(LineFormat::e1);
    line.count(kNoFrame, 100);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(100));
    line.count(kClean, 10);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(100));
}

TEST(LineFailuresTest, FailureAcrossABorderIsTakenBackFromBothIntervals) {
    CountedLine line(LineFormat::d4);
    line.count(kNoSignal);
    line.closeInterval();
    line.count(kNoSignal);
    EXPECT_EQ(line.previous().severelyErrorSeconds, 1);
    line.count(kNoSignal);
    EXPECT_EQ(line.previous(), unavailableSeconds(1));
    EXPECT_EQ(line.running(), unavailableSeconds(2));
}

TEST(LineFailuresTest, ErrorsWhileAFailureClearsKeepTheLineUnavailable) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 5);
    line.count(kClean, 5);
    line.count(kSevere);
    line.count(kClean, 9);
    EXPECT_EQ(line.failures(), LineDefects());
    EXPECT_TRUE(line.unavailable());
    line.count(kClean);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(11));
}

TEST(LineFailuresTest, LineIsUnavailableForAsLongAsAFailureClears) {
    CountedLine line(LineFormat::esf, {.declaration = 2, .clearing = 15});
    line.count(kNoSignal, 5);
    line.count({.pathCodeViolations = 1}, 14);
    EXPECT_TRUE(line.unavailable());
    line.count(kClean);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(
        line.running(),
        (LineCounts{.errorSeconds = 14, .unavailableSeconds = 5, .pathCodingViolations = 14}));
}

TEST(LineFailuresTest, FailureThatClearsAtOnceLeavesTheTenGoodSeconds) {
    CountedLine line(LineFormat::esf, {.declaration = 2, .clearing = 0});
    line.count(kNoSignal, 4);
    line.count(kSignalIsBack);
    EXPECT_EQ(line.failures(), LineDefects());
    line.count(kClean, 9);
    EXPECT_TRUE(line.unavailable());
    line.count(kClean);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(5));
}

TEST(LineFailuresTest, LongestDeclarationTakesBackAllOfIt) {
    CountedLine line(LineFormat::e1, {.declaration = 9, .clearing = 10});
    line.count(kSevere, 9);
    line.count(kNoFrame, 9);
    EXPECT_FALSE(line.unavailable());
    line.count(kNoFrame);
    EXPECT_EQ(line.running(), unavailableSeconds(19));
}

TEST(LineFailuresTest, LineFoundWithADefectIsUnavailableFromItsFirstSecond) {
    CountedLine line(LineFormat::esf);
    line.begin({.lossOfSignal = true, .outOfFrame = true});
    EXPECT_TRUE(line.failures().lossOfSignal);
    line.count(kNoSignal);
    EXPECT_EQ(line.running(), unavailableSeconds(1));
    line.count(kClean, 10);
    EXPECT_EQ(line.running(), unavailableSeconds(1));
    EXPECT_FALSE(line.unavailable());
}

TEST(LineFailuresTest, NothingInARowGoesOnAcrossAnInterruption) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 9);
    line.interrupt();
    line.count(kSevere, 9);
    line.interrupt();
    line.count(kNoSignal, 2);
    line.interrupt();
    line.count(kNoSignal, 2);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running().severelyErrorSeconds, 22);
    line.count(kNoSignal);
    EXPECT_EQ(line.running().unavailableSeconds, 3);
    EXPECT_EQ(line.running().severelyErrorSeconds, 20);
}

TEST(LineFailuresTest, LineStaysUnavailableAcrossAnInterruption) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 5);
    line.count(kClean, 9);
    line.interrupt();
    EXPECT_TRUE(line.unavailable());
    EXPECT_TRUE(line.failures().lossOfSignal);
    line.count(kClean, 9);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(23));
    line.count(kClean);
    EXPECT_EQ(line.running(), unavailableSeconds(14));
}

TEST(LineFailuresTest, MinuteThatAReturnHadBegunIsLostInAnInterruption) {
    CountedLine line(LineFormat::esf);
    line.count({.pathCodeViolations = 92});
    line.count(kClean, 54);
    line.count(kNoSignal, 5);
    line.count({.pathCodeViolations = 1}, 9);
    line.interrupt();
    line.count(kClean, 10);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running().degradedMinutes, 0);
}

} // namespace
