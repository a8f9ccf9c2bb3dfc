// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimIntervalTable.h"

#include <utility>

#include "platform/ActionScheduler_pthread.h"

namespace {

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

Z7SimIntervalTable::Z7SimIntervalTable(LineFormat format, std::shared_ptr<LineSource> source,
                                       std::shared_ptr<LineState> state,
                                       std::vector<DS1LineCounters> const& past)
    : m_source(std::move(source)), m_state(std::move(state)), m_performance(format) {
    // The base has the table ticking already. A day of past takes a while: no tick may come
    // between.
    ActionScheduler* const scheduler = ActionScheduler_pthread::GetScheduler();
    scheduler->Remove(this);
    replay(past);
    m_source->read(m_last);
    if (past.empty()) m_performance.begin(defectsOf(m_last));
    m_state->begin(m_last.alarms, m_performance);
    scheduler->AddPeriodic(this, 1);
}

Z7SimIntervalTable::~Z7SimIntervalTable() {
    ActionScheduler_pthread::GetScheduler()->Remove(this);
}

int Z7SimIntervalTable::GetControlledSlipSeconds(int n) {
    DS1Interval const* const record = interval(n);
    return record == nullptr ? 0 : static_cast<int>(record->ControlledSlipSeconds);
}

int Z7SimIntervalTable::GetDegradedMinutes(int n) {
    DS1Interval const* const record = interval(n);
    return record == nullptr ? 0 : static_cast<int>(record->DegradedMinutes);
}

int Z7SimIntervalTable::CollectSecond() {
    DS1LineCounters now = m_last;
    m_source->read(now);
    count(now);
    m_state->update(now.alarms, m_performance);
    return 0;
}

int Z7SimIntervalTable::CloseInterval() {
    close();
    // A tick is a second, this one too.
    return CollectSecond();
}

void Z7SimIntervalTable::replay(std::vector<DS1LineCounters> const& past) {
    if (past.empty()) return;
    m_last = past.front();
    for (std::size_t i = 1; i < past.size(); ++i) {
        if (m_timeElapsed >= kIntervalLength) close();
        count(past[i]);
    }
}

void Z7SimIntervalTable::count(DS1LineCounters const& now) {
    LinePerformance::Change const change = m_performance.count(secondBetween(m_last, now));
    m_last = now;
    m_timeElapsed += 1;
    add(change.running, m_current);
    add(change.previous, *interval(1));
}

void Z7SimIntervalTable::close() {
    ArchiveInterval(m_current);
    m_current = DS1Interval();
    m_performance.closeInterval();
}
