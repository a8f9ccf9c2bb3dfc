// SPDX-License-Identifier: BSD-2-Clause
// The model of a DS1 line: even counting, touched seconds, alarms, and its replayed past.
#include "simulator/chassis/Line.h"

#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "simulator/chassis/LineDraft.h"
#include "simulator/chassis/LinePast.h"

namespace {

using namespace kvlsim;
using namespace std::chrono_literals;

/// Rates of so many billionths of each kind.
LineRates rates(std::uint64_t code, std::uint64_t path = 0, std::uint64_t framing = 0,
                std::uint64_t slips = 0) {
    return {code, path, framing, slips};
}

TEST(LineTest, NewLineCountsItsSecondsOnly) {
    DS1LineCounters const counters = Line().counters(61s + 999ms);
    EXPECT_EQ(counters.seconds, 61U);
    EXPECT_EQ(counters.lineCodeViolations, 0U);
    EXPECT_EQ(counters.outOfFrameSeconds, 0U);
    EXPECT_EQ(counters.alarms, 0U);
}

TEST(LineTest, SteadyErrorsAreTheWholePartOfRateTimesAge) {
    Line line;
    line.setRates(rates(500'000'000, 290'000'000, 1'500'000'000, 1'000'000), 0s);
    EXPECT_EQ(line.counters(1999ms).lineCodeViolations, 0U);
    EXPECT_EQ(line.counters(2s).lineCodeViolations, 1U);
    EXPECT_EQ(line.counters(100s).pathCodeViolations, 29U);
    EXPECT_EQ(line.counters(100s).framingErrors, 150U);
    EXPECT_EQ(line.counters(999s).controlledSlips, 0U);
    EXPECT_EQ(line.counters(1000s).controlledSlips, 1U);
}

TEST(LineTest, PartOfAnErrorIsKeptWhenTheRateChanges) {
    Line line;
    line.setRates(rates(300'000'000), 0s);
    line.setRates(rates(100'000'000), 3s); // 0.9 so far
    EXPECT_EQ(line.counters(3999ms).lineCodeViolations, 0U);
    EXPECT_EQ(line.counters(4s).lineCodeViolations, 1U);
}

TEST(LineTest, LargestRateCountsExactlyForADay) {
    Line line;
    line.setRates(rates(kMaxLineRate * kLineRateUnit), 0s);
    EXPECT_EQ(line.counters(86400s + 1us).lineCodeViolations,
              static_cast<std::uint32_t>(86400ULL * kMaxLineRate + 1));
}

TEST(LineTest, AddedErrorsCountAtOnceAndWrap) {
    Line line;
    line.add({0xFFFFFFFF, 2, 3, 4});
    line.add({2, 0, 0, 0});
    DS1LineCounters const counters = line.counters(0s);
    EXPECT_EQ(counters.lineCodeViolations, 1U);
    EXPECT_EQ(counters.pathCodeViolations, 2U);
    EXPECT_EQ(counters.framingErrors, 3U);
    EXPECT_EQ(counters.controlledSlips, 4U);
}

TEST(LineTest, LossOfSignalCountsEverySecondThatItTouches) {
    Line line;
    line.setRaised(kDS1AlarmLossOfSignal, 10s + 900ms);
    EXPECT_EQ(line.counters(10s + 900ms).lossOfSignalSeconds, 1U);
    EXPECT_EQ(line.counters(11s).lossOfSignalSeconds, 1U);
    EXPECT_EQ(line.counters(11s + 1ns).lossOfSignalSeconds, 2U);
    line.setRaised(0, 12s + 100ms);
    EXPECT_EQ(line.counters(60s).lossOfSignalSeconds, 3U);
}

TEST(LineTest, DefectFromWholeSecondToWholeSecondTouchesNoSecondBehindIt) {
    Line line;
    line.setRaised(kDS1AlarmLossOfSignal, 10s);
    EXPECT_EQ(line.counters(70s).lossOfSignalSeconds, 60U);
    line.setRaised(0, 70s);
    EXPECT_EQ(line.counters(71s).lossOfSignalSeconds, 60U);
}

TEST(LineTest, TouchWithoutAnyDurationCounts) {
    Line line;
    line.setRaised(kDS1AlarmLossOfSignal, 10s);
    line.setRaised(0, 10s);
    EXPECT_EQ(line.counters(20s).lossOfSignalSeconds, 1U);
}

TEST(LineTest, SecondThatIsTouchedAgainCountsOnce) {
    Line line;
    for (auto const begin : {10s + 0ms, 10s + 200ms, 10s + 800ms}) {
        line.setRaised(kDS1AlarmLossOfSignal, begin);
        line.setRaised(0, begin + 100ms);
    }
    EXPECT_EQ(line.counters(20s).lossOfSignalSeconds, 1U);
    line.setRaised(kDS1AlarmLossOfSignal, 20s + 500ms);
    EXPECT_EQ(line.counters(20s + 500ms).lossOfSignalSeconds, 2U);
}

TEST(LineTest, EveryLossOfFrameCountsAsSecondsOutOfFrame) {
    for (std::uint32_t const alarm :
         {kDS1AlarmLossOfSignal, kDS1AlarmLossOfFrame, kDS1AlarmIndication}) {
        Line line;
        line.setRaised(alarm, 10s);
        line.setRaised(0, 13s);
        DS1LineCounters const counters = line.counters(20s);
        EXPECT_EQ(counters.outOfFrameSeconds, 3U);
        EXPECT_EQ(counters.lossOfSignalSeconds, alarm == kDS1AlarmLossOfSignal ? 3U : 0U);
        EXPECT_EQ(counters.alarmIndicationSeconds, alarm == kDS1AlarmIndication ? 3U : 0U);
    }
}

TEST(LineTest, OneRootFollowingAnotherKeepsTheLineOutOfFrame) {
    Line line;
    line.setRaised(kDS1AlarmLossOfSignal, 10s + 500ms);
    line.setRaised(kDS1AlarmIndication, 12s + 500ms);
    line.setRaised(0, 14s + 500ms);
    EXPECT_EQ(line.counters(20s).outOfFrameSeconds, 5U);
}

TEST(LineTest, LineWithoutFrameSendsRaiAndNamesTheRootOnly) {
    Line line;
    line.setRaised(kDS1AlarmLossOfSignal, 1s);
    EXPECT_EQ(line.counters(1s).alarms, kDS1AlarmLossOfSignal | kDS1AlarmSendingRemote);
    EXPECT_EQ(line.raised(), kDS1AlarmLossOfSignal);
    line.setRaised(0, 2s);
    EXPECT_EQ(line.counters(2s).alarms, 0U);
}

TEST(LineTest, FarEndsAlarmTakesNoFrameAway) {
    Line line;
    line.setRaised(kDS1AlarmRemote | kDS1AlarmLoopback, 1s);
    DS1LineCounters const counters = line.counters(9s);
    EXPECT_EQ(counters.alarms, kDS1AlarmRemote | kDS1AlarmLoopback);
    EXPECT_EQ(counters.outOfFrameSeconds, 0U);
}

std::vector<DS1LineCounters> recordsOf(LinePast const& past) {
    std::vector<DS1LineCounters> records;
    replayPast(past, [&](DS1LineCounters const& record) { records.push_back(record); });
    return records;
}

TEST(LinePastTest, HasARecordOfEverySecondWithBothEnds) {
    auto const records = recordsOf({60, rates(500'000'000), {}});
    ASSERT_EQ(records.size(), 61U);
    for (std::uint32_t second = 0; second <= 60; ++second) {
        EXPECT_EQ(records[second].seconds, second);
        EXPECT_EQ(records[second].lineCodeViolations, second / 2);
    }
}

TEST(LinePastTest, SpellShowsInTheRecordsBehindItsBeginning) {
    auto const records =
        recordsOf({60, {}, {{50, 20, kDS1AlarmLossOfSignal, rates(3'000'000'000)}}});
    EXPECT_EQ(records[10].alarms, 0U);
    EXPECT_EQ(records[11].alarms, kDS1AlarmLossOfSignal | kDS1AlarmSendingRemote);
    EXPECT_EQ(records[30].alarms, kDS1AlarmLossOfSignal | kDS1AlarmSendingRemote);
    EXPECT_EQ(records[31].alarms, 0U);
    for (std::size_t second = 10; second <= 30; ++second) {
        EXPECT_EQ(records[second].lossOfSignalSeconds, second - 10);
        EXPECT_EQ(records[second].lineCodeViolations, 3 * (second - 10));
    }
    EXPECT_EQ(records[60].outOfFrameSeconds, 20U);
    EXPECT_EQ(records[60].lineCodeViolations, 60U);
}

TEST(LinePastTest, OverlappingSpellsAddUp) {
    auto const records = recordsOf({60,
                                    rates(1'000'000'000),
                                    {{50, 20, kDS1AlarmRemote, rates(2'000'000'000)},
                                     {40, 20, kDS1AlarmRemote | kDS1AlarmLoopback, {}},
                                     {20, 5, kDS1AlarmRemote, rates(5'000'000'000)}}});
    EXPECT_EQ(records[25].alarms, kDS1AlarmRemote | kDS1AlarmLoopback);
    EXPECT_EQ(records[35].alarms, kDS1AlarmRemote | kDS1AlarmLoopback);
    EXPECT_EQ(records[42].alarms, kDS1AlarmRemote);
    EXPECT_EQ(records[46].alarms, 0U);
    EXPECT_EQ(records[60].lineCodeViolations, 60U + 2 * 20 + 5 * 5);
}

TEST(LinePastTest, LineContinuesFromTheEndOfItsPast) {
    LineDraft draft;
    draft.past = {100, rates(700'000'000), {{30, 30, kDS1AlarmIndication, {}}}};
    draft.rates = rates(0, 100'000'000);
    draft.alarms = kDS1AlarmRemote;
    Line const line = lineAtLoading(draft);
    DS1LineCounters const last = recordsOf(draft.past).back();
    DS1LineCounters const first = line.counters(100s);
    EXPECT_EQ(first.seconds, last.seconds);
    EXPECT_EQ(first.lineCodeViolations, 70U);
    EXPECT_EQ(first.lineCodeViolations, last.lineCodeViolations);
    EXPECT_EQ(first.alarmIndicationSeconds, 30U);
    EXPECT_EQ(first.alarmIndicationSeconds, last.alarmIndicationSeconds);
    EXPECT_EQ(first.alarms, kDS1AlarmRemote);
    DS1LineCounters const later = line.counters(110s);
    EXPECT_EQ(later.lineCodeViolations, 70U);
    EXPECT_EQ(later.pathCodeViolations, 1U);
    EXPECT_EQ(later.alarmIndicationSeconds, 30U);
}

} // namespace
