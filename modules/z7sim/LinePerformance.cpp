// SPDX-License-Identifier: BSD-2-Clause
#include "LinePerformance.h"

#include <algorithm>

namespace {

constexpr std::int32_t kDecidingRun = 10;
constexpr std::int32_t kMinute = 60;
constexpr LineCounts kUnavailableSecond{.unavailableSeconds = 1};

} // namespace

LineCounts& LineCounts::operator+=(LineCounts const& other) {
    errorSeconds += other.errorSeconds;
    severelyErrorSeconds += other.severelyErrorSeconds;
    severelyErrorFramingSeconds += other.severelyErrorFramingSeconds;
    unavailableSeconds += other.unavailableSeconds;
    controlledSlipSeconds += other.controlledSlipSeconds;
    pathCodingViolations += other.pathCodingViolations;
    lineErrorSeconds += other.lineErrorSeconds;
    burstyErrorSeconds += other.burstyErrorSeconds;
    degradedMinutes += other.degradedMinutes;
    lineCodeViolations += other.lineCodeViolations;
    return *this;
}

LineCounts& LineCounts::operator-=(LineCounts const& other) {
    errorSeconds -= other.errorSeconds;
    severelyErrorSeconds -= other.severelyErrorSeconds;
    severelyErrorFramingSeconds -= other.severelyErrorFramingSeconds;
    unavailableSeconds -= other.unavailableSeconds;
    controlledSlipSeconds -= other.controlledSlipSeconds;
    pathCodingViolations -= other.pathCodingViolations;
    lineErrorSeconds -= other.lineErrorSeconds;
    burstyErrorSeconds -= other.burstyErrorSeconds;
    degradedMinutes -= other.degradedMinutes;
    lineCodeViolations -= other.lineCodeViolations;
    return *this;
}

LinePerformance::LinePerformance(LineFormat format) : m_format(format) {}

LinePerformance::Change LinePerformance::count(LineSecond const& second) {
    LineCounts available = availableSecond(second);
    bool const isSevere = available.severelyErrorSeconds != 0;
    if (!isSevere) {
        if (m_unavailable && m_runLength == 0) m_minuteBeforeRun = m_minute;
        available.degradedMinutes = completesDegradedMinute(available) ? 1 : 0;
    }
    Change change;
    change.running = m_unavailable ? kUnavailableSecond : available;
    if (isSevere == m_unavailable) {
        breakRun();
        return change;
    }
    m_correction.running += m_unavailable ? available : kUnavailableSecond;
    m_correction.running -= change.running;
    if (++m_runLength < kDecidingRun) return change;
    change.running += m_correction.running;
    change.previous = m_correction.previous;
    m_unavailable = !m_unavailable;
    m_runLength = 0;
    m_correction = Change();
    return change;
}

void LinePerformance::closeInterval() {
    m_correction.previous = m_correction.running;
    m_correction.running = LineCounts();
}

bool LinePerformance::hasCrc() const {
    return m_format == LineFormat::esf || m_format == LineFormat::e1Crc;
}

std::int32_t LinePerformance::bitsPerSecond() const {
    return m_format == LineFormat::esf || m_format == LineFormat::d4 ? 1'544'000 : 2'048'000;
}

/// What the second counts if the line is available in it, but for the minute it may complete.
LineCounts LinePerformance::availableSecond(LineSecond const& second) const {
    auto const limited = [this](std::uint64_t violations) {
        auto const most = static_cast<std::uint64_t>(bitsPerSecond());
        return static_cast<std::int32_t>(std::min(violations, most));
    };
    std::uint64_t const crcErrors = hasCrc() ? second.pathCodeViolations : 0;
    bool const noFrame = second.outOfFrame || second.lossOfSignal;
    bool const slip = second.controlledSlips != 0;

    LineCounts counts;
    counts.pathCodingViolations = limited(crcErrors + second.framingErrors);
    counts.lineCodeViolations = limited(second.lineCodeViolations);
    bool const pathError = counts.pathCodingViolations != 0;
    bool const lineError = counts.lineCodeViolations != 0;
    bool const error = pathError || noFrame || slip || second.alarmIndication ||
                       // Without a CRC the line's code is what shows most of the errors.
                       (!hasCrc() && lineError);
    bool const bursty = m_format == LineFormat::esf && counts.pathCodingViolations > 1 &&
                        counts.pathCodingViolations < 320 && !noFrame && !second.alarmIndication;
    counts.errorSeconds = error ? 1 : 0;
    counts.severelyErrorSeconds = severe(second, counts) ? 1 : 0;
    counts.severelyErrorFramingSeconds = noFrame || second.alarmIndication ? 1 : 0;
    counts.controlledSlipSeconds = slip ? 1 : 0;
    counts.lineErrorSeconds = lineError ? 1 : 0;
    counts.burstyErrorSeconds = bursty ? 1 : 0;
    return counts;
}

/// `counts`: has the second's violations.
bool LinePerformance::severe(LineSecond const& second, LineCounts const& counts) const {
    if (second.outOfFrame || second.lossOfSignal) return true;
    switch (m_format) {
    case LineFormat::esf:
        return counts.pathCodingViolations >= 320 || second.alarmIndication;
    case LineFormat::d4:
        return counts.pathCodingViolations >= 1 || counts.lineCodeViolations >= 1544;
    case LineFormat::e1:
        return counts.lineCodeViolations >= 2048;
    case LineFormat::e1Crc:
        return counts.pathCodingViolations >= 832;
    }
    return false;
}

/// Adds a second that is not severely errored to the minute; true when that makes it a degraded
/// one. A full minute gives way to a new one.
bool LinePerformance::completesDegradedMinute(LineCounts const& counts) {
    m_minute.errors += counts.pathCodingViolations;
    if (!hasCrc()) m_minute.errors += counts.lineCodeViolations;
    if (++m_minute.seconds < kMinute) return false;
    std::int64_t const bits = std::int64_t{kMinute} * bitsPerSecond();
    std::int64_t const errors = m_minute.errors;
    m_minute = Minute();
    return errors * 1'000'000 > bits && errors * 1'000 <= bits;
}

/// The line stays what it is, so nothing will be corrected.
void LinePerformance::breakRun() {
    if (m_runLength == 0) return;
    if (m_unavailable) m_minute = m_minuteBeforeRun;
    m_runLength = 0;
    m_correction = Change();
}
