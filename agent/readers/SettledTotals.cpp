// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/SettledTotals.h"

#include <algorithm>

#include "board/DS1IntervalTable.h"
#include "board/DS1LineDevice.h"

namespace kvloamd {

namespace {

constexpr std::int64_t kIntervalLength = DS1IntervalTable::kIntervalLength;

/// A gap of more intervals than this is as good as a new history: the oldest are being forgotten.
constexpr std::int64_t kLongestGap = DS1IntervalTable::kIntervals - 4;

bool countsSeconds(std::size_t counter) {
    return counter != kPathCodingViolations && counter != kDegradedMinutes &&
           counter != kLineCodeViolations;
}

/// A count that is not known counts nothing.
template <class Sums>
void add(LineCounts const& counts, Sums& sums) {
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        sums[counter] += std::max(counts[counter], 0);
}

} // namespace

LineTotals SettledTotals::add(LineRow const& row) {
    if (!row.isWhole || !row.keepsHistory() || !row.timeElapsed) return totals();
    if (!continues(row))
        beginAnew(row);
    else
        archive(row);
    Reading now{row.intervalsClosed * kIntervalLength + *row.timeElapsed, countsOf(row)};
    if (hasLost(now.counts)) {
        // The history is not the one that was read before.
        beginAnew(row);
        now.counts = countsOf(row);
    }
    for (std::size_t counter = 0; counter < kLineCounters; ++counter) {
        m_counters[counter].known = row.running[counter] >= 0;
        if (!m_last) m_counters[counter].base = now.counts[counter];
    }
    if (!m_last) m_last = now;
    settle(now, row);
    m_closed = row.intervalsClosed;
    m_hadClosed = row.closedIntervals() > 0;
    m_last = now;
    return totals();
}

void SettledTotals::rest() {
    for (Counter& counter : m_counters) {
        counter.before = counter.total();
        counter.settled.reset();
    }
    m_history = 0;
    m_last.reset();
    m_wasUnavailable = false;
    m_available = {};
}

void SettledTotals::beginAnew(LineRow const& row) {
    rest();
    m_history = row.history;
    m_archived = {};
}

/// Whether everything that was closed since the last reading is there.
bool SettledTotals::continues(LineRow const& row) const {
    std::int64_t const closed = row.intervalsClosed - m_closed;
    if (m_history == 0 || row.history != m_history || closed < 0 || closed > kLongestGap)
        return false;
    return static_cast<std::int64_t>(row.closedIntervals()) >= closed + (m_hadClosed ? 1 : 0);
}

/// The newest closed interval may still be corrected; those before it stay what they are.
void SettledTotals::archive(LineRow const& row) {
    auto const closed = static_cast<std::size_t>(row.intervalsClosed - m_closed);
    std::size_t const end = std::min(closed + 1, row.closedIntervals());
    if (closed == 0) return;
    for (std::size_t place = 1; place < end; ++place)
        if (place < closed || m_hadClosed) kvloamd::add(row.closed->counts[place], m_archived);
}

SettledTotals::Sums SettledTotals::countsOf(LineRow const& row) const {
    Sums counts = m_archived;
    if (row.closedIntervals() > 0) kvloamd::add(row.closed->counts.front(), counts);
    kvloamd::add(row.running, counts);
    return counts;
}

bool SettledTotals::hasLost(Sums const& counts) const {
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        if (counts[counter] < m_counters[counter].settled) return true;
    return false;
}

void SettledTotals::settle(Reading const& now, LineRow const& row) {
    if (!row.lineStatus) {
        settleClosed(now, row);
    } else if ((*row.lineStatus & DS1LineStatusUnavailSigState) != 0) {
        settleUnavailable(now);
        m_wasUnavailable = true;
        return;
    } else {
        settleAvailable(now);
    }
    m_wasUnavailable = false;
}

void SettledTotals::settleAvailable(Reading const& now) {
    std::int64_t const passed = now.time - m_last->time;
    advance(kUnavailableSeconds, now.counts[kUnavailableSeconds], passed);
    if (!m_available.empty() &&
        m_available.back().counts[kUnavailableSeconds] != now.counts[kUnavailableSeconds])
        m_available.clear();
    auto const isSettled = [&](Reading const& reading) {
        return now.time - reading.time >= kUnsettled;
    };
    auto const unsettled = std::find_if_not(m_available.begin(), m_available.end(), isSettled);
    if (unsettled != m_available.begin()) {
        auto const newest = std::prev(unsettled);
        for (std::size_t counter = 0; counter < kLineCounters; ++counter)
            if (counter != kUnavailableSeconds) advance(counter, newest->counts[counter], passed);
        m_available.erase(m_available.begin(), newest);
    }
    // Nearly every reading is like the one before.
    if (m_available.empty() || m_available.back().counts != now.counts) m_available.push_back(now);
}

void SettledTotals::settleUnavailable(Reading const& now) {
    std::int64_t const passed = now.time - m_last->time;
    m_available.clear();
    advance(kUnavailableSeconds, now.counts[kUnavailableSeconds] - kUnsettled, passed);
    // A status may be older than the counts: what two readings agree on is settled.
    if (!m_wasUnavailable) return;
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        if (counter != kUnavailableSeconds)
            advance(counter, std::min(m_last->counts[counter], now.counts[counter]), passed);
}

void SettledTotals::settleClosed(Reading const& now, LineRow const& row) {
    m_available.clear();
    Sums closed = m_archived;
    if (row.closedIntervals() > 0 && *row.timeElapsed >= kUnsettled)
        kvloamd::add(row.closed->counts.front(), closed);
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        advance(counter, closed[counter], now.time - m_last->time);
}

void SettledTotals::advance(std::size_t counter, std::int64_t to, std::int64_t passed) {
    Counter& advanced = m_counters[counter];
    std::int64_t const from = std::max(advanced.settled.value_or(advanced.base), advanced.base);
    if (countsSeconds(counter)) to = std::min(to, from + passed);
    advanced.settled = std::max(advanced.settled.value_or(to), to);
}

LineTotals SettledTotals::totals() const {
    LineTotals totals{};
    for (std::size_t counter = 0; counter < kLineCounters; ++counter)
        totals[counter] = m_counters[counter].known ? m_counters[counter].total() : kUnknownTotal;
    return totals;
}

void AllSettledTotals::add(std::uint32_t ifIndex, LineRow& row) {
    row.totals = m_lines[ifIndex].add(row);
}

void AllSettledTotals::rest(std::uint32_t ifIndex) {
    if (auto const line = m_lines.find(ifIndex); line != m_lines.end()) line->second.rest();
}

} // namespace kvloamd
