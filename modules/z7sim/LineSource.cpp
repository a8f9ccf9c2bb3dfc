// SPDX-License-Identifier: BSD-2-Clause
#include "LineSource.h"

#include <cstdint>

#include "ObjectAttributes.h"

namespace {

/// How long ago a past may have ended. A board comes up within seconds of its platform; one that is
/// started later begins without history, like a card after a reset.
constexpr std::uint32_t kFreshSeconds = 60;
/// What the history of a line spans.
constexpr int kLongestPast = 24 * 3600;

} // namespace

bool PlatformLine::read(DS1LineCounters& counters) {
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

LineSecond secondBetween(DS1LineCounters const& before, DS1LineCounters const& now) {
    // All counts grow modulo 2^32; the age does not come round within a century.
    if (now.seconds < before.seconds) return {};
    LineSecond second;
    second.lineCodeViolations = now.lineCodeViolations - before.lineCodeViolations;
    second.pathCodeViolations = now.pathCodeViolations - before.pathCodeViolations;
    second.framingErrors = now.framingErrors - before.framingErrors;
    second.controlledSlips = now.controlledSlips - before.controlledSlips;
    second.lossOfSignal = now.lossOfSignalSeconds != before.lossOfSignalSeconds;
    second.outOfFrame = now.outOfFrameSeconds != before.outOfFrameSeconds;
    second.alarmIndication = now.alarmIndicationSeconds != before.alarmIndicationSeconds;
    return second;
}
