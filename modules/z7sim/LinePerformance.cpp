// SPDX-License-Identifier: BSD-2-Clause
#include "LinePerformance.h"

#include <algorithm>

namespace {

constexpr std::int32_t kDecidingRun = 10;
constexpr LineCounts kUnavailableSecond{.unavailableSeconds = 1};

bool hasDefect(LineSecond const& second) {
    return second.lossOfSignal || second.outOfFrame || second.alarmIndication;
}

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

LinePerformance::Recent::Recent(LineCounts const& counts, Minute const& before)
    : m_pathCodingViolations(counts.pathCodingViolations),
      m_lineCodeViolations(counts.lineCodeViolations),
      m_before(before) {
    unsigned bit = 1;
    for (std::int32_t const count :
         {counts.errorSeconds, counts.severelyErrorSeconds, counts.severelyErrorFramingSeconds,
          counts.controlledSlipSeconds, counts.lineErrorSeconds, counts.burstyErrorSeconds,
          counts.degradedMinutes}) {
        if (count != 0) m_ones = static_cast<std::uint16_t>(m_ones | bit);
        bit <<= 1U;
    }
}

LineCounts LinePerformance::Recent::counts() const {
    auto const one = [this](unsigned place) { return m_ones >> place & 1; };
    return {.errorSeconds = one(0),
            .severelyErrorSeconds = one(1),
            .severelyErrorFramingSeconds = one(2),
            .controlledSlipSeconds = one(3),
            .pathCodingViolations = m_pathCodingViolations,
            .lineErrorSeconds = one(4),
            .burstyErrorSeconds = one(5),
            .degradedMinutes = one(6),
            .lineCodeViolations = m_lineCodeViolations};
}

LinePerformance::LinePerformance(LineFormat format, FailureTimes const& times)
    : m_format(format), m_times(times) {}

void LinePerformance::begin(LineDefects const& defects) {
    m_signal.begin(defects.lossOfSignal);
    m_frame.begin(defects.lossOfSignal || defects.outOfFrame);
    m_indication.begin(defects.alarmIndication);
    m_unavailable = defects != LineDefects();
    noteFailures();
}

LinePerformance::Change LinePerformance::count(LineSecond const& second) {
    LineCounts counts = availableSecond(second);
    if (m_unavailable || counts.severelyErrorSeconds != 0 || hasDefect(second) || !m_isQuiet)
        return countClosely(second, counts);
    // Nothing of this second will ever be corrected, nor of those before it.
    m_run = 0;
    m_remembered = 0;
    counts.degradedMinutes = completesDegradedMinute(counts) ? 1 : 0;
    return {counts, {}};
}

LinePerformance::Change LinePerformance::countClosely(LineSecond const& second, LineCounts counts) {
    bool const isSevere = counts.severelyErrorSeconds != 0;
    Minute const before = m_minute;
    if (!isSevere) counts.degradedMinutes = completesDegradedMinute(counts) ? 1 : 0;
    remember(counts, before);
    countFailures(second);
    Change change;
    change.running = m_unavailable ? kUnavailableSecond : counts;
    if (!m_unavailable) {
        m_run = isSevere ? m_run + 1 : 0;
        if (int const seconds = secondsToTakeBack(); seconds > 0)
            becomeUnavailable(seconds, change);
    } else if (isSevere || sustainsFailure(second)) {
        m_minute = recent(m_run).before();
        m_run = 0;
    } else if (++m_run >= kDecidingRun && failures() == LineDefects()) {
        becomeAvailable(change);
    }
    return change;
}

void LinePerformance::interrupt() {
    if (m_unavailable && m_run > 0) m_minute = recent(m_run - 1).before();
    m_run = 0;
    m_remembered = 0;
    m_signal.interrupt();
    m_frame.interrupt();
    m_indication.interrupt();
    noteFailures();
}

void LinePerformance::closeInterval() {
    for (int ago = 0; ago < m_remembered; ++ago)
        recent(ago).closeInterval();
}

void LinePerformance::countFailures(LineSecond const& second) {
    LineDefects const& ended = second.ended;
    bool const noFrame = second.lossOfSignal || second.outOfFrame;
    bool const signalLost = second.lossOfSignal && !ended.lossOfSignal;
    bool const frameLost = second.outOfFrame && !ended.outOfFrame;
    m_signal.count(second.lossOfSignal, signalLost, m_times);
    m_frame.count(noFrame, signalLost || frameLost, m_times);
    m_indication.count(second.alarmIndication, second.alarmIndication && !ended.alarmIndication,
                       m_times);
    noteFailures();
}

/// Keeps at hand what every second asks about the failures.
void LinePerformance::noteFailures() {
    m_isQuiet = m_signal.isIdle() && m_frame.isIdle() && m_indication.isIdle();
    m_failures = {m_signal.isDeclared(), m_frame.isDeclared(), m_indication.isDeclared()};
}

/// How many of the last seconds of an available line have turned out to be unavailable.
int LinePerformance::secondsToTakeBack() const {
    int seconds = m_run >= kDecidingRun ? m_run : 0;
    for (auto const* failure : {&m_signal, &m_frame, &m_indication})
        if (failure->isDeclared())
            seconds = std::max(seconds, withSevereBefore(failure->sinceOnset()));
    return seconds;
}

/// So many of the last seconds, and the severely errored ones directly before them.
int LinePerformance::withSevereBefore(int seconds) const {
    while (seconds < m_remembered && recent(seconds).severe())
        ++seconds;
    return seconds;
}

/// Whether the second has the defect of a failure that is declared.
bool LinePerformance::sustainsFailure(LineSecond const& second) const {
    return (second.lossOfSignal && m_signal.isDeclared()) ||
           ((second.lossOfSignal || second.outOfFrame) && m_frame.isDeclared()) ||
           (second.alarmIndication && m_indication.isDeclared());
}

void LinePerformance::becomeUnavailable(int seconds, Change& change) {
    for (int ago = 0; ago < seconds; ++ago) {
        Recent const& each = recent(ago);
        if (each.isForgotten()) continue;
        LineCounts& interval = each.isRunning() ? change.running : change.previous;
        interval -= each.counts();
        interval += kUnavailableSecond;
    }
    m_minute = recent(seconds - 1).before();
    m_unavailable = true;
    m_decidedAfter = seconds;
    m_run = 0;
}

void LinePerformance::becomeAvailable(Change& change) {
    for (int ago = 0; ago < m_run; ++ago) {
        Recent const& each = recent(ago);
        if (each.isForgotten()) continue;
        LineCounts& interval = each.isRunning() ? change.running : change.previous;
        interval -= kUnavailableSecond;
        interval += each.counts();
    }
    m_unavailable = false;
    m_decidedAfter = m_run;
    m_run = 0;
}

/// A second that is remembered; 0: the newest.
LinePerformance::Recent& LinePerformance::recent(int ago) {
    return m_recent[static_cast<std::size_t>((m_newest - ago + kRecent) % kRecent)];
}

void LinePerformance::remember(LineCounts const& counts, Minute const& before) {
    m_newest = (m_newest + 1) % kRecent;
    m_remembered = std::min(m_remembered + 1, kRecent);
    recent(0) = Recent(counts, before);
}

bool LinePerformance::hasCrc() const {
    return m_format == LineFormat::esf || m_format == LineFormat::e1Crc;
}

std::int32_t LinePerformance::bitsPerSecond() const {
    return m_format == LineFormat::esf || m_format == LineFormat::d4 ? 1'544'000 : 2'048'000;
}

/// What the second counts if the line is available in it, except for a minute that it completes.
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

/// `counts`: the second's, with its violations.
bool LinePerformance::severe(LineSecond const& second, LineCounts const& counts) const {
    bool const noFrame = second.outOfFrame || second.lossOfSignal;
    switch (m_format) {
    case LineFormat::esf:
        return noFrame || counts.pathCodingViolations >= 320 || second.alarmIndication;
    case LineFormat::d4:
        return noFrame || counts.pathCodingViolations >= 1 || counts.lineCodeViolations >= 1544;
    case LineFormat::e1:
        // Without a frame it has nothing that errors could be counted in; that is a failure.
        return counts.lineCodeViolations >= 2048;
    case LineFormat::e1Crc:
        return noFrame || counts.pathCodingViolations >= 832;
    case LineFormat::other:
        return false;
    }
    return false;
}

/// Adds a second that is not severely errored to the minute. Returns whether that completes a
/// degraded one. After sixty seconds a new minute begins.
bool LinePerformance::completesDegradedMinute(LineCounts const& counts) {
    m_minute.errors += counts.pathCodingViolations;
    if (!hasCrc()) m_minute.errors += counts.lineCodeViolations;
    if (++m_minute.seconds < kMinute) return false;
    std::int64_t const bits = std::int64_t{kMinute} * bitsPerSecond();
    std::int64_t const errors = m_minute.errors;
    m_minute = Minute();
    return errors * 1'000'000 > bits && errors * 1'000 <= bits;
}
