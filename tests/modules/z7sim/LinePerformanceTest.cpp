// SPDX-License-Identifier: BSD-2-Clause
// What seconds make of a line's counters: each border once, worked out by hand.
#include <cstdint>

#include <initializer_list>
#include <vector>

#include <gtest/gtest.h>

#include "LinePerformance.h"
#include "tests/modules/z7sim/CountedLine.h"

namespace {

constexpr auto kFormats = {LineFormat::esf, LineFormat::d4, LineFormat::e1, LineFormat::e1Crc};
constexpr LineSecond kClean;
constexpr LineSecond kNoSignal{.lossOfSignal = true};
/// Severely errored in every format, without a defect.
constexpr LineSecond kSevere{
    .lineCodeViolations = 2048, .pathCodeViolations = 832, .framingErrors = 1};

/// What one second counts on a new line.
LineCounts counted(LineFormat format, LineSecond const& second) {
    return LinePerformance(format).count(second).running;
}

bool isSevere(LineFormat format, LineSecond const& second) {
    return counted(format, second).severelyErrorSeconds == 1;
}

/// What so many seconds without signal count while the line is available.
LineCounts secondsWithoutSignal(int n) {
    return {.errorSeconds = n, .severelyErrorSeconds = n, .severelyErrorFramingSeconds = n};
}

/// What so many `kSevere` count on an available line with a CRC.
LineCounts severeSeconds(int n) {
    return {.errorSeconds = n,
            .severelyErrorSeconds = n,
            .pathCodingViolations = 833 * n,
            .lineErrorSeconds = n,
            .lineCodeViolations = 2048 * n};
}

LineCounts unavailableSeconds(int n) {
    return {.unavailableSeconds = n};
}

TEST(LineCountsTest, AreAddedAndTakenAwayCountByCount) {
    LineCounts ones;
    LineCounts sum;
    std::int32_t n = 0;
    for (auto const& field : kLineCountsFields) {
        ones.*field.count = 1;
        sum.*field.count = 10 * ++n;
    }
    sum += ones;
    sum += ones;
    sum -= ones;
    n = 0;
    for (auto const& field : kLineCountsFields)
        EXPECT_EQ(sum.*field.count, 10 * ++n + 1) << field.name;
}

TEST(LinePerformanceTest, CleanSecondCountsNothing) {
    for (auto format : kFormats)
        EXPECT_EQ(counted(format, kClean), LineCounts());
}

TEST(LinePerformanceTest, OneCrcErrorMakesAnErrorSecondThatIsNotBursty) {
    LineCounts const expected{.errorSeconds = 1, .pathCodingViolations = 1};
    EXPECT_EQ(counted(LineFormat::esf, {.pathCodeViolations = 1}), expected);
    EXPECT_EQ(counted(LineFormat::e1Crc, {.pathCodeViolations = 1}), expected);
}

TEST(LinePerformanceTest, CrcErrorsMeanNothingWithoutCrc) {
    EXPECT_EQ(counted(LineFormat::d4, {.pathCodeViolations = 5000}), LineCounts());
    EXPECT_EQ(counted(LineFormat::e1, {.pathCodeViolations = 5000}), LineCounts());
}

TEST(LinePerformanceTest, FramingErrorsArePathCodingViolations) {
    LineCounts const expected{.errorSeconds = 1, .pathCodingViolations = 5};
    LineCounts bursty = expected;
    bursty.burstyErrorSeconds = 1;
    LineCounts severe = expected;
    severe.severelyErrorSeconds = 1;
    EXPECT_EQ(counted(LineFormat::esf, {.pathCodeViolations = 3, .framingErrors = 2}), bursty);
    EXPECT_EQ(counted(LineFormat::e1Crc, {.pathCodeViolations = 3, .framingErrors = 2}), expected);
    EXPECT_EQ(counted(LineFormat::d4, {.framingErrors = 5}), severe);
    EXPECT_EQ(counted(LineFormat::e1, {.framingErrors = 5}), expected);
}

TEST(LinePerformanceTest, LineCodeViolationMakesAnErrorSecondOnlyWithoutCrc) {
    LineCounts lineOnly{.lineErrorSeconds = 1, .lineCodeViolations = 7};
    EXPECT_EQ(counted(LineFormat::esf, {.lineCodeViolations = 7}), lineOnly);
    EXPECT_EQ(counted(LineFormat::e1Crc, {.lineCodeViolations = 7}), lineOnly);
    lineOnly.errorSeconds = 1;
    EXPECT_EQ(counted(LineFormat::d4, {.lineCodeViolations = 7}), lineOnly);
    EXPECT_EQ(counted(LineFormat::e1, {.lineCodeViolations = 7}), lineOnly);
}

TEST(LinePerformanceTest, OneLineCodeViolationMakesALineErrorSecond) {
    for (auto format : kFormats)
        EXPECT_EQ(counted(format, {.lineCodeViolations = 1}).lineErrorSeconds, 1);
}

TEST(LinePerformanceTest, SecondsWithSlipsAreCountedAndAreErrorSeconds) {
    LineCounts const expected{.errorSeconds = 1, .controlledSlipSeconds = 1};
    for (auto format : kFormats) {
        EXPECT_EQ(counted(format, {.controlledSlips = 1}), expected);
        EXPECT_EQ(counted(format, {.controlledSlips = 4'000'000'000}), expected);
    }
}

TEST(LinePerformanceTest, SignalOrFrameLostIsSevereExceptForE1WithoutCrc) {
    for (auto format : {LineFormat::esf, LineFormat::d4, LineFormat::e1Crc}) {
        EXPECT_EQ(counted(format, {.lossOfSignal = true}), secondsWithoutSignal(1));
        EXPECT_EQ(counted(format, {.outOfFrame = true}), secondsWithoutSignal(1));
    }
    constexpr LineCounts kErrored{.errorSeconds = 1, .severelyErrorFramingSeconds = 1};
    EXPECT_EQ(counted(LineFormat::e1, {.lossOfSignal = true}), kErrored);
    EXPECT_EQ(counted(LineFormat::e1, {.outOfFrame = true}), kErrored);
}

TEST(LinePerformanceTest, AlarmIndicationIsSevereForExtendedSuperframesOnly) {
    LineCounts expected{.errorSeconds = 1, .severelyErrorFramingSeconds = 1};
    for (auto format : {LineFormat::d4, LineFormat::e1, LineFormat::e1Crc})
        EXPECT_EQ(counted(format, {.alarmIndication = true}), expected);
    expected.severelyErrorSeconds = 1;
    EXPECT_EQ(counted(LineFormat::esf, {.alarmIndication = true}), expected);
}

TEST(LinePerformanceTest, EsfIsSevereFrom320PathCodingViolations) {
    EXPECT_FALSE(isSevere(LineFormat::esf, {.pathCodeViolations = 319}));
    EXPECT_TRUE(isSevere(LineFormat::esf, {.pathCodeViolations = 320}));
    EXPECT_TRUE(isSevere(LineFormat::esf, {.pathCodeViolations = 300, .framingErrors = 20}));
    EXPECT_FALSE(isSevere(LineFormat::esf, {.lineCodeViolations = 5000}));
}

TEST(LinePerformanceTest, E1WithCrcIsSevereFrom832PathCodingViolations) {
    EXPECT_FALSE(isSevere(LineFormat::e1Crc, {.pathCodeViolations = 831}));
    EXPECT_TRUE(isSevere(LineFormat::e1Crc, {.pathCodeViolations = 832}));
    EXPECT_TRUE(isSevere(LineFormat::e1Crc, {.pathCodeViolations = 831, .framingErrors = 1}));
    EXPECT_FALSE(isSevere(LineFormat::e1Crc, {.lineCodeViolations = 5000}));
}

TEST(LinePerformanceTest, D4IsSevereFrom1544LineCodeViolationsOrOneFramingError) {
    EXPECT_FALSE(isSevere(LineFormat::d4, {.lineCodeViolations = 1543}));
    EXPECT_TRUE(isSevere(LineFormat::d4, {.lineCodeViolations = 1544}));
    EXPECT_TRUE(isSevere(LineFormat::d4, {.framingErrors = 1}));
}

TEST(LinePerformanceTest, E1IsSevereFrom2048LineCodeViolations) {
    EXPECT_FALSE(isSevere(LineFormat::e1, {.lineCodeViolations = 2047}));
    EXPECT_TRUE(isSevere(LineFormat::e1, {.lineCodeViolations = 2048}));
    EXPECT_FALSE(isSevere(LineFormat::e1, {.framingErrors = 5000}));
}

TEST(LinePerformanceTest, BurstyIsMoreThanOneAndFewerThan320) {
    auto const bursty = [](LineSecond const& second) {
        return counted(LineFormat::esf, second).burstyErrorSeconds;
    };
    EXPECT_EQ(bursty({.pathCodeViolations = 1}), 0);
    EXPECT_EQ(bursty({.pathCodeViolations = 2}), 1);
    EXPECT_EQ(bursty({.pathCodeViolations = 319}), 1);
    EXPECT_EQ(bursty({.pathCodeViolations = 320}), 0);
    EXPECT_EQ(bursty({.pathCodeViolations = 2, .controlledSlips = 1}), 1);
    EXPECT_EQ(bursty({.pathCodeViolations = 2, .lossOfSignal = true}), 0);
    EXPECT_EQ(bursty({.pathCodeViolations = 2, .outOfFrame = true}), 0);
    EXPECT_EQ(bursty({.pathCodeViolations = 2, .alarmIndication = true}), 0);
}

TEST(LinePerformanceTest, OnlyExtendedSuperframesHaveBurstyErrorSeconds) {
    for (auto format : {LineFormat::d4, LineFormat::e1, LineFormat::e1Crc})
        EXPECT_EQ(counted(format, {.pathCodeViolations = 2, .framingErrors = 2}).burstyErrorSeconds,
                  0);
}

TEST(LinePerformanceTest, SecondHasNoMoreViolationsThanTheLineHasBits) {
    constexpr LineSecond kMost{.lineCodeViolations = 4'294'967'295,
                               .pathCodeViolations = 4'294'967'295,
                               .framingErrors = 4'294'967'295};
    for (auto format : kFormats) {
        bool const t1 = format == LineFormat::esf || format == LineFormat::d4;
        int const bits = t1 ? 1'544'000 : 2'048'000;
        EXPECT_EQ(counted(format, kMost).lineCodeViolations, bits);
        EXPECT_EQ(counted(format, kMost).pathCodingViolations, bits);
    }
}

TEST(LinePerformanceTest, NineSevereSecondsLeaveTheLineAvailable) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 9);
    line.count(kClean);
    line.count(kSevere, 9);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), severeSeconds(18));
}

TEST(LinePerformanceTest, TenSevereSecondsAreTakenBackAsUnavailable) {
    CountedLine line(LineFormat::esf);
    constexpr LineSecond kFull{.lineCodeViolations = 3,
                               .pathCodeViolations = 400,
                               .framingErrors = 1,
                               .controlledSlips = 1};
    line.count({.pathCodeViolations = 2});
    LineCounts const before = line.running();
    line.count(kFull, 9);
    EXPECT_FALSE(line.unavailable());
    LineCounts expected{.errorSeconds = -9,
                        .severelyErrorSeconds = -9,
                        .unavailableSeconds = 10,
                        .controlledSlipSeconds = -9,
                        .pathCodingViolations = -9 * 401,
                        .lineErrorSeconds = -9,
                        .lineCodeViolations = -9 * 3};
    EXPECT_EQ(line.count(kFull).running, expected);
    EXPECT_TRUE(line.unavailable());
    expected = before;
    expected += unavailableSeconds(10);
    EXPECT_EQ(line.running(), expected);
}

TEST(LinePerformanceTest, NothingElseIsCountedWhileUnavailable) {
    for (auto format : kFormats) {
        CountedLine line(format);
        line.count(kNoSignal, 10);
        line.count({.lineCodeViolations = 5000,
                    .pathCodeViolations = 5000,
                    .framingErrors = 1,
                    .controlledSlips = 1,
                    .alarmIndication = true},
                   20);
        EXPECT_EQ(line.running(), unavailableSeconds(30));
    }
}

TEST(LinePerformanceTest, SlipsNeverMakeTheLineUnavailable) {
    for (auto format : kFormats) {
        CountedLine line(format);
        line.count({.controlledSlips = 1000}, 100);
        EXPECT_FALSE(line.unavailable());
        EXPECT_EQ(line.running(), (LineCounts{.errorSeconds = 100, .controlledSlipSeconds = 100}));
    }
}

TEST(LinePerformanceTest, NineGoodSecondsLeaveTheLineUnavailable) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 10);
    line.count({.pathCodeViolations = 1}, 9);
    line.count(kSevere);
    line.count({.pathCodeViolations = 1}, 9);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(29));
}

TEST(LinePerformanceTest, TenGoodSecondsCountAsTheAvailableSecondsTheyWere) {
    CountedLine line(LineFormat::esf);
    line.count(kNoSignal, 12);
    line.count({.lineCodeViolations = 1}, 4);
    line.count({.pathCodeViolations = 2}, 5);
    EXPECT_EQ(line.running(), unavailableSeconds(21));
    line.count({.controlledSlips = 1});
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), (LineCounts{.errorSeconds = 6,
                                          .unavailableSeconds = 12,
                                          .controlledSlipSeconds = 1,
                                          .pathCodingViolations = 10,
                                          .lineErrorSeconds = 4,
                                          .burstyErrorSeconds = 5,
                                          .lineCodeViolations = 4}));
}

TEST(LinePerformanceTest, LineThatCameBackNeedsTenSevereSecondsAgain) {
    CountedLine line(LineFormat::e1);
    line.count(kSevere, 10);
    line.count(kClean, 10);
    line.count(kSevere, 9);
    EXPECT_FALSE(line.unavailable());
    line.count(kSevere);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.running(), unavailableSeconds(20));
}

TEST(LinePerformanceTest, RunAcrossTheBorderIsTakenBackFromBothIntervals) {
    CountedLine line(LineFormat::e1Crc);
    line.count({.pathCodeViolations = 1}, 3);
    line.count({.pathCodeViolations = 900}, 4);
    line.closeInterval();
    line.count(kSevere, 5);
    EXPECT_EQ(line.previous().unavailableSeconds, 0);
    LinePerformance::Change const change = line.count(kSevere);
    LineCounts running = unavailableSeconds(6);
    running -= severeSeconds(5);
    EXPECT_EQ(change.running, running);
    EXPECT_EQ(change.previous, (LineCounts{.errorSeconds = -4,
                                           .severelyErrorSeconds = -4,
                                           .unavailableSeconds = 4,
                                           .pathCodingViolations = -3600}));
    EXPECT_EQ(line.running(), unavailableSeconds(6));
    EXPECT_EQ(line.previous(),
              (LineCounts{.errorSeconds = 3, .unavailableSeconds = 4, .pathCodingViolations = 3}));
}

TEST(LinePerformanceTest, ReturnAcrossTheBorderIsCountedInBothIntervals) {
    CountedLine line(LineFormat::d4);
    line.count(kSevere, 20);
    line.count({.lineCodeViolations = 5}, 7);
    line.closeInterval();
    line.count({.controlledSlips = 1}, 3);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.previous(), (LineCounts{.errorSeconds = 7,
                                           .unavailableSeconds = 20,
                                           .lineErrorSeconds = 7,
                                           .lineCodeViolations = 35}));
    EXPECT_EQ(line.running(), (LineCounts{.errorSeconds = 3, .controlledSlipSeconds = 3}));
}

TEST(LinePerformanceTest, RunThatEndsAtTheBorderIsNotTakenBackLater) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 9);
    line.closeInterval();
    line.count(kClean);
    line.count(kSevere, 9);
    EXPECT_EQ(line.previous(), severeSeconds(9));
    LinePerformance::Change const change = line.count(kSevere);
    EXPECT_EQ(change.previous, LineCounts());
    EXPECT_EQ(line.running(), unavailableSeconds(10));
}

TEST(LinePerformanceTest, CorrectionsOlderThanThePreviousIntervalAreLost) {
    CountedLine line(LineFormat::esf);
    line.count(kSevere, 3);
    line.closeInterval();
    line.count(kSevere, 5);
    line.closeInterval();
    line.count(kSevere, 2);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.intervals(),
              (std::vector{severeSeconds(3), unavailableSeconds(5), unavailableSeconds(2)}));
}

TEST(LinePerformanceTest, IntervalsMayBeOneSecondOrNone) {
    CountedLine line(LineFormat::esf);
    for (int i = 0; i < 9; ++i) {
        line.count(kSevere);
        line.closeInterval();
    }
    line.count(kSevere);
    EXPECT_TRUE(line.unavailable());
    EXPECT_EQ(line.previous(), unavailableSeconds(1));
    EXPECT_EQ(line.intervals()[7], severeSeconds(1));
    line.closeInterval();
    line.closeInterval();
    line.count(kClean, 10);
    EXPECT_FALSE(line.unavailable());
    EXPECT_EQ(line.running(), LineCounts());
}

} // namespace
