// SPDX-License-Identifier: BSD-2-Clause
// A line's degraded minutes: which errors make one, and which seconds.
#include <gtest/gtest.h>

#include "LinePerformance.h"
#include "tests/modules/z7sim/CountedLine.h"

namespace {

constexpr LineSecond kClean;
constexpr LineSecond kNoSignal{.lossOfSignal = true};

/// How many degraded minutes come of this second and 59 clean ones.
int minutesOf(LineFormat format, LineSecond const& second) {
    CountedLine line(format);
    line.count(second);
    EXPECT_EQ(line.running().severelyErrorSeconds, 0);
    line.count(kClean, 58);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count(kClean);
    return line.running().degradedMinutes;
}

/// An extended superframe line with so many errors in so many seconds.
CountedLine begun(std::uint32_t errors, int seconds) {
    CountedLine line(LineFormat::esf);
    line.count({.pathCodeViolations = errors});
    line.count(kClean, seconds - 1);
    return line;
}

TEST(DegradedMinutesTest, T1MinuteIsDegradedFrom93Errors) {
    EXPECT_EQ(minutesOf(LineFormat::esf, {.pathCodeViolations = 92}), 0);
    EXPECT_EQ(minutesOf(LineFormat::esf, {.pathCodeViolations = 93}), 1);
    EXPECT_EQ(minutesOf(LineFormat::d4, {.lineCodeViolations = 92}), 0);
    EXPECT_EQ(minutesOf(LineFormat::d4, {.lineCodeViolations = 93}), 1);
}

TEST(DegradedMinutesTest, E1MinuteIsDegradedFrom123Errors) {
    EXPECT_EQ(minutesOf(LineFormat::e1Crc, {.pathCodeViolations = 122}), 0);
    EXPECT_EQ(minutesOf(LineFormat::e1Crc, {.pathCodeViolations = 123}), 1);
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 122}), 0);
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 123}), 1);
}

TEST(DegradedMinutesTest, FramingErrorsAreErrorsOfTheMinute) {
    EXPECT_EQ(minutesOf(LineFormat::esf, {.pathCodeViolations = 90, .framingErrors = 2}), 0);
    EXPECT_EQ(minutesOf(LineFormat::esf, {.pathCodeViolations = 90, .framingErrors = 3}), 1);
    EXPECT_EQ(minutesOf(LineFormat::e1Crc, {.pathCodeViolations = 120, .framingErrors = 2}), 0);
    EXPECT_EQ(minutesOf(LineFormat::e1Crc, {.pathCodeViolations = 120, .framingErrors = 3}), 1);
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 120, .framingErrors = 2}), 0);
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 120, .framingErrors = 3}), 1);
}

TEST(DegradedMinutesTest, LineCodeViolationsDoNotDegradeAMinuteWithCrc) {
    EXPECT_EQ(minutesOf(LineFormat::esf, {.lineCodeViolations = 5000}), 0);
    EXPECT_EQ(minutesOf(LineFormat::e1Crc, {.lineCodeViolations = 5000}), 0);
}

TEST(DegradedMinutesTest, MoreThanOneErrorInAThousandBitsIsTooMuch) {
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 2000, .framingErrors = 120'880}), 1);
    EXPECT_EQ(minutesOf(LineFormat::e1, {.lineCodeViolations = 2000, .framingErrors = 120'881}), 0);
}

TEST(DegradedMinutesTest, MostThatAnAvailableMinuteBearsInTheOtherFormatsDegradesIt) {
    CountedLine esf(LineFormat::esf);
    esf.count({.pathCodeViolations = 319}, 60);
    EXPECT_EQ(esf.running().degradedMinutes, 1);
    CountedLine d4(LineFormat::d4);
    d4.count({.lineCodeViolations = 1543}, 60);
    EXPECT_EQ(d4.running().degradedMinutes, 1);
    CountedLine e1Crc(LineFormat::e1Crc);
    e1Crc.count({.pathCodeViolations = 831}, 60);
    EXPECT_EQ(e1Crc.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, EveryMinuteStartsWithoutErrors) {
    CountedLine line = begun(92, 60);
    line.count({.pathCodeViolations = 92});
    line.count(kClean, 59);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count({.pathCodeViolations = 2}, 120);
    EXPECT_EQ(line.running().degradedMinutes, 2);
}

TEST(DegradedMinutesTest, SevereSecondsAndTheirErrorsBelongToNoMinute) {
    CountedLine line = begun(92, 58);
    line.count({.pathCodeViolations = 320}, 5);
    line.count(kClean, 2);
    EXPECT_EQ(line.running().degradedMinutes, 0);

    CountedLine degraded = begun(93, 58);
    degraded.count({.pathCodeViolations = 320}, 5);
    degraded.count(kClean);
    EXPECT_EQ(degraded.running().degradedMinutes, 0);
    degraded.count(kClean);
    EXPECT_EQ(degraded.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, MinuteBelongsToTheIntervalOfItsLastSecond) {
    CountedLine line = begun(93, 59);
    line.closeInterval();
    line.count(kClean);
    EXPECT_EQ(line.previous().degradedMinutes, 0);
    EXPECT_EQ(line.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, MinuteMaySpanManyIntervals) {
    CountedLine line(LineFormat::esf);
    for (int i = 0; i < 59; ++i) {
        line.count({.pathCodeViolations = 2});
        line.closeInterval();
    }
    line.count(kClean);
    EXPECT_EQ(line.running().degradedMinutes, 1);
    EXPECT_EQ(line.previous().degradedMinutes, 0);
}

TEST(DegradedMinutesTest, MinuteGoesOnAcrossUnavailability) {
    CountedLine line = begun(50, 30);
    line.count(kNoSignal, 100);
    line.count({.pathCodeViolations = 43});
    line.count(kClean, 28);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count(kClean);
    EXPECT_EQ(line.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, GoodSecondsCompleteAMinuteOnceTheLineIsAvailable) {
    CountedLine line = begun(93, 55);
    line.count(kNoSignal, 10);
    line.count(kClean, 9);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count(kClean);
    EXPECT_EQ(line.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, MinuteCompletedByAReturnGoesToTheIntervalOfItsLastSecond) {
    CountedLine line = begun(93, 55);
    line.count(kNoSignal, 10);
    line.count(kClean, 5);
    line.closeInterval();
    line.count(kClean, 5);
    EXPECT_EQ(line.previous().degradedMinutes, 1);
    EXPECT_EQ(line.running().degradedMinutes, 0);
}

TEST(DegradedMinutesTest, ReturnAddsTheSecondsAfterACompletedMinuteToTheNext) {
    CountedLine line = begun(92, 55);
    line.count(kNoSignal, 10);
    line.count(kClean, 5);
    line.count({.pathCodeViolations = 20}, 5);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count(kClean, 54);
    EXPECT_EQ(line.running().degradedMinutes, 0);
    line.count(kClean);
    EXPECT_EQ(line.running().degradedMinutes, 1);
}

TEST(DegradedMinutesTest, ReturnThatFailsLeavesTheMinuteAsItWas) {
    CountedLine line = begun(92, 55);
    line.count(kNoSignal, 10);
    line.count({.pathCodeViolations = 1}, 9);
    line.count(kNoSignal);
    line.count(kClean, 10);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running().degradedMinutes, 0);

    CountedLine degraded = begun(93, 55);
    degraded.count(kNoSignal, 10);
    degraded.count(kClean, 9);
    degraded.count(kNoSignal);
    degraded.count(kClean, 10);
    EXPECT_EQ(degraded.running().degradedMinutes, 1);
}

} // namespace
