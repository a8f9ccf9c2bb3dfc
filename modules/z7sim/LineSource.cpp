// SPDX-License-Identifier: BSD-2-Clause
#include "LineSource.h"

#include <cstdint>

#include "LineGenerations.h"
#include "ObjectAttributes.h"

namespace {

/// How long ago a past may have ended. A board comes up within seconds of its platform; one that is
/// started later begins without history, like a card after a reset.
constexpr std::uint32_t kFreshSeconds = 60;
/// What the history of a line spans.
constexpr int kLongestPast = 24 * 3600;

} // namespace

bool PlatformLine::read(DS1LineCounters& counters) {
    if (m_silent) return false;
    DS1LineCounters answer{};
    if (bytesAttribute(m_device, kDS1LineCounters, &answer, sizeof answer) != sizeof answer)
        return false;
    counters = answer;
    return true;
}

std::vector<DS1LineCounters> PlatformLine::past() {
    int const seconds = numberAttributeOr(m_device, kDS1LinePastSeconds, 0);
    if (seconds < 1 || seconds > kLongestPast) return {};
    std::vector<DS1LineCounters> records(static_cast<std::size_t>(seconds) + 1);
    std::size_t const size = records.size() * sizeof(DS1LineCounters);
    DS1LineCounters now{};
    if (bytesAttribute(m_device, kDS1LinePast, records.data(), size) != size || !read(now))
        return {};
    if (now.seconds - records.back().seconds > kFreshSeconds) return {};
    return records;
}

PlatformBoard::PlatformBoard(long board)
    : m_board(board), m_generations(LineGenerations::instance()) {}

DS1BoardGeneration PlatformBoard::generation() {
    return m_generations.of(m_board, m_place);
}

std::size_t PlatformBoard::read(std::span<DS1BoardLine> lines) {
    return bytesAttribute(m_board, kDS1BoardCounters, lines.data(), lines.size_bytes()) /
           sizeof(DS1BoardLine);
}

LineDefects defectsOf(DS1LineCounters const& now) {
    return {(now.alarms & kDS1AlarmLossOfSignal) != 0, (now.alarms & kFrameLosingAlarms) != 0,
            (now.alarms & kDS1AlarmIndication) != 0};
}

LineSecond secondBetween(DS1LineCounters const& before, DS1LineCounters const& now) {
    // All counts grow modulo 2^32.
    LineSecond second;
    second.lineCodeViolations = now.lineCodeViolations - before.lineCodeViolations;
    second.pathCodeViolations = now.pathCodeViolations - before.pathCodeViolations;
    second.framingErrors = now.framingErrors - before.framingErrors;
    second.controlledSlips = now.controlledSlips - before.controlledSlips;
    // The line counts the seconds of its own clock: between two readings there may be none.
    LineDefects const atEnd = defectsOf(now);
    auto const wasThere = [](std::uint32_t secondsBefore, std::uint32_t secondsNow, bool isThere) {
        return isThere || secondsNow != secondsBefore;
    };
    second.lossOfSignal =
        wasThere(before.lossOfSignalSeconds, now.lossOfSignalSeconds, atEnd.lossOfSignal);
    second.outOfFrame = wasThere(before.outOfFrameSeconds, now.outOfFrameSeconds, atEnd.outOfFrame);
    second.alarmIndication =
        wasThere(before.alarmIndicationSeconds, now.alarmIndicationSeconds, atEnd.alarmIndication);
    second.ended = {second.lossOfSignal && !atEnd.lossOfSignal,
                    second.outOfFrame && !atEnd.outOfFrame,
                    second.alarmIndication && !atEnd.alarmIndication};
    return second;
}
