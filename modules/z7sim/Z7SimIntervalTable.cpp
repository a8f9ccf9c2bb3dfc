// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimIntervalTable.h"

#include <algorithm>
#include <cstddef>
#include <utility>

#include "LineScheduler.h"
#include "platform/ActionScheduler_pthread.h"

namespace {

constexpr std::size_t kCacheLine = 64;

void add(LineCounts const& counts, DS1Interval& interval) {
    if (counts == LineCounts()) return;
    interval.ErrorSeconds += counts.errorSeconds;
    interval.SeverelyErrorSeconds += counts.severelyErrorSeconds;
    interval.SeverelyErrorFramingSeconds += counts.severelyErrorFramingSeconds;
    interval.UnavailableSeconds += counts.unavailableSeconds;
    interval.ControlledSlipSeconds += counts.controlledSlipSeconds;
    interval.PathCodingViolations += counts.pathCodingViolations;
    interval.LineErrorSeconds += counts.lineErrorSeconds;
    interval.BurstyErrorSeconds += counts.burstyErrorSeconds;
    interval.DegradedMinutes += counts.degradedMinutes;
    interval.LineCodeViolations += counts.lineCodeViolations;
}

} // namespace

Z7SimIntervalTable::Z7SimIntervalTable(LineFormat format, FailureTimes const& times,
                                       std::shared_ptr<LineSource> source,
                                       std::shared_ptr<LineState> state,
                                       std::vector<DS1LineCounters> const& past, Ticked ticked)
    : m_source(std::move(source)), m_state(std::move(state)), m_performance(format, times) {
    // The base class has entered the table with the process's scheduler.
    ActionScheduler_pthread::GetScheduler()->Remove(this);
    LineScheduler& scheduler = LineScheduler::instance();
    begin(past);
    if (ticked == Ticked::alone) scheduler.AddPeriodic(this, 1);
}

Z7SimIntervalTable::~Z7SimIntervalTable() {
    LineScheduler::instance().Remove(this);
}

/// Counts the past, and takes the line as it is now.
void Z7SimIntervalTable::begin(std::vector<DS1LineCounters> const& past) {
    replay(past);
    DS1LineCounters now{};
    if (!m_source->read(now)) {
        m_seconds.begin(LineScheduler::time());
        return;
    }
    if (past.empty()) {
        m_performance.begin(defectsOf(now));
        m_last = now;
    } else if (std::int64_t const passed = std::int64_t{now.seconds} - m_last.seconds; passed > 1) {
        miss(passed);
        m_last = now;
    }
    m_seconds.begin(m_last.seconds, LineScheduler::time());
    m_shown = lineStatusParts(now.alarms, m_performance);
    m_state->begin(now.alarms, m_performance);
    m_last.alarms = now.alarms; // which the status shows
}

int Z7SimIntervalTable::GetControlledSlipSeconds(int n) {
    DS1Interval const* const record = interval(n);
    return record == nullptr ? 0 : static_cast<int>(record->ControlledSlipSeconds);
}

int Z7SimIntervalTable::GetDegradedMinutes(int n) {
    DS1Interval const* const record = interval(n);
    return record == nullptr ? 0 : static_cast<int>(record->DegradedMinutes);
}

/// Without the base's look for a handle: a table is complete when it enters a list, and leaves it
/// before it is destroyed.
int Z7SimIntervalTable::ScheduledAction() {
    return m_timeElapsed < kIntervalLength ? CollectSecond() : CloseInterval();
}

int Z7SimIntervalTable::CollectSecond() {
    DS1LineCounters now{};
    if (m_source->read(now))
        answered(now);
    else
        miss(m_seconds.silent(LineScheduler::time()).missed);
    return 0;
}

void Z7SimIntervalTable::tick(DS1LineCounters const& now) {
    if (m_timeElapsed >= kIntervalLength) close();
    answered(now);
}

void Z7SimIntervalTable::fetch() const {
    __builtin_prefetch(&m_timeElapsed, 1);
    __builtin_prefetch(&m_current.LineCodeViolations, 1);
    auto const* const own = reinterpret_cast<char const*>(&m_last);
    for (std::size_t offset = 0; offset <= 2 * kCacheLine; offset += kCacheLine)
        __builtin_prefetch(own + offset, 1);
}

void Z7SimIntervalTable::answered(DS1LineCounters const& now) {
    if (isCleanBetween(m_last, now) && countClean(now.seconds)) return;
    long const time = LineScheduler::time();
    LineTick const tick = m_seconds.answered(now.seconds, time);
    if (tick.missed > 0) miss(tick.missed);
    if (tick.counts) count(now);
    m_last = now;
    showStatus(now.alarms);
}

/// Nearly every second is like the one before, and does not touch the state.
void Z7SimIntervalTable::showStatus(std::uint32_t alarms) {
    std::uint64_t const shown = lineStatusParts(alarms, m_performance);
    if (shown == m_shown) return;
    m_shown = shown;
    m_state->update(alarms, m_performance);
}

int Z7SimIntervalTable::CloseInterval() {
    close();
    // The tick that closes an interval is a second, too.
    return CollectSecond();
}

bool Z7SimIntervalTable::IsIntervalValid(int n) {
    if (n == 0) return !m_missed;
    // The oldest place of a full ring is empty.
    if (n < 0 || n >= kIntervals || n > GetValidIntervals()) return false;
    return !m_closedMissed[static_cast<std::size_t>(GetTrueIndex(n))];
}

void Z7SimIntervalTable::replay(std::vector<DS1LineCounters> const& past) {
    if (past.empty()) return;
    m_last = past.front();
    for (std::size_t i = 1; i < past.size(); ++i) {
        if (m_timeElapsed >= kIntervalLength) close();
        count(past[i]);
        m_last = past[i];
    }
}

void Z7SimIntervalTable::count(DS1LineCounters const& now) {
    LinePerformance::Change const change = m_performance.count(secondBetween(m_last, now));
    m_timeElapsed += 1;
    add(change.running, m_current);
    add(change.previous, *interval(1));
}

/// Passes time of which there is no data.
void Z7SimIntervalTable::miss(std::int64_t seconds) {
    m_performance.interrupt();
    // What the ring would not hold to the end is only counted.
    constexpr std::int64_t most = std::int64_t{kIntervals + 1} * kIntervalLength;
    if (seconds > most) {
        std::int64_t const forgotten = (seconds - most) / kIntervalLength;
        m_closed += static_cast<std::int32_t>(forgotten);
        seconds -= forgotten * kIntervalLength;
    }
    while (seconds > 0) {
        if (m_timeElapsed >= kIntervalLength) close();
        auto const left = std::int64_t{kIntervalLength} - m_timeElapsed;
        std::int64_t const passed = std::min(seconds, left);
        m_missed = true;
        m_timeElapsed += static_cast<std::int32_t>(passed);
        seconds -= passed;
    }
}

void Z7SimIntervalTable::close() {
    m_closedMissed[static_cast<std::size_t>(GetTrueIndex(0))] = m_missed.load();
    ArchiveInterval(m_current);
    m_closed += 1;
    m_current = DS1Interval();
    m_missed = false;
    m_performance.closeInterval();
}
