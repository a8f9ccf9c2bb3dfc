// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/LineHistories.h"

#include <algorithm>

#include "board/DS1IntervalValidity.h"
#include "board/Interface.h"

namespace kvloamd {

namespace {

/// When a table was not read for so long, the time elapsed does not tell whether it closed an
/// interval.
constexpr std::chrono::seconds kLongestGap{DS1IntervalTable::kIntervalLength / 2};

/// How far into the running interval the newest closed one may still be corrected: what makes time
/// unavailable shows after ten seconds of it.
constexpr int kCorrected = 60;

/// Interval `n`; 0 is the running one.
LineCounts readInterval(DS1IntervalTable& table, int n) {
    return {table.GetErrorSeconds(n),
            table.GetSeverelyErrorSeconds(n),
            table.GetSeverelyErrorFramingSeconds(n),
            table.GetUnavailableSeconds(n),
            table.GetControlledSlipSeconds(n),
            table.GetPathCodingViolations(n),
            table.GetLineErrorSeconds(n),
            table.GetBurstyErrorSeconds(n),
            table.GetDegradedMinutes(n),
            table.GetLineCodeViolations(n)};
}

int closedOf(DS1IntervalTable& table) {
    return std::clamp(table.GetValidIntervals(), 0, DS1IntervalTable::kIntervals);
}

/// Adds an interval to the sums. What one interval does not know, the sum does not know.
void add(LineCounts const& counts, LineCounts& total) {
    for (std::size_t counter = 0; counter < counts.size(); ++counter)
        total[counter] = counts[counter] < 0 || total[counter] < 0
                             ? std::int32_t{KVL::kNotSupported}
                             : total[counter] + counts[counter];
}

/// `validity`: null for a table that does not miss data.
std::shared_ptr<ClosedIntervals const> readClosed(DS1IntervalTable& table,
                                                  DS1IntervalValidity* validity) {
    auto closed = std::make_shared<ClosedIntervals>();
    int const count = closedOf(table);
    closed->valid.reserve(static_cast<std::size_t>(count));
    for (int n = 1; n <= count; ++n) {
        LineCounts const counts = readInterval(table, n);
        closed->counts.push_back(counts);
        // The oldest record of a full history is cleared for the interval to come.
        closed->valid.push_back(validity == nullptr ? n < DS1IntervalTable::kIntervals
                                                    : validity->IsIntervalValid(n));
        if (closed->valid.back()) add(counts, closed->total);
    }
    closed->counts.shrink_to_fit();
    return closed;
}

} // namespace

void LineHistories::begin(Clock::time_point now) {
    if (m_kept.size() > m_readSince)
        std::erase_if(m_kept, [this](auto const& kept) { return kept.second.readAt != m_now; });
    m_now = now;
    m_readSince = 0;
}

bool LineHistories::stands(ReferenceCounter<DS1IntervalTable> const& handle, LineRow const& row) {
    DS1IntervalTable& table = *handle.unlocked();
    auto const found = m_kept.find(&table);
    if (found == m_kept.end()) return false;
    Kept& kept = found->second;
    // A second that is counted passes time.
    if (!row.isWhole || row.history != kept.number || m_now - kept.readAt > kLongestGap ||
        table.GetTimeElapsed() != row.timeElapsed)
        return false;
    if (kept.validity != nullptr && kept.validity->GetIntervalsClosed() != kept.intervalsClosed)
        return false;
    kept.readAt = m_now;
    ++m_readSince;
    return true;
}

void LineHistories::read(ReferenceCounter<DS1IntervalTable> const& handle, LineRow& row) {
    DS1IntervalTable& table = *handle.unlocked();
    int const elapsed = table.GetTimeElapsed();
    // The running interval lasts 900 seconds for the moment in which it is closed.
    row.timeElapsed = std::clamp(elapsed, 0, DS1IntervalTable::kIntervalLength - 1);
    row.running = readInterval(table, 0);
    auto const [place, isNew] = m_kept.try_emplace(&table);
    Kept& kept = place->second;
    if (isNew) {
        kept.table = handle;
        kept.validity = dynamic_cast<DS1IntervalValidity*>(&table);
        kept.number = ++m_numbered;
        kept.formerElapsed = elapsed;
        kept.readAt = m_now;
    }
    int const closedNow = kept.validity == nullptr ? 0 : kept.validity->GetIntervalsClosed();
    if (kept.validity == nullptr)
        countIntervals(kept, elapsed);
    else
        kept.allIntervals = closedNow;
    if (isNew || closedNow != kept.intervalsClosed || !isUnchanged(kept, table, elapsed))
        kept.closed = readClosed(table, kept.validity);
    kept.intervalsClosed = closedNow;
    row.closed = kept.closed;
    row.history = kept.number;
    row.intervalsClosed = kept.allIntervals;
    // A table counts a second beginning with the time elapsed, and while it closes an interval that
    // is 0 or a whole interval.
    row.isWhole = elapsed > 0 && elapsed < DS1IntervalTable::kIntervalLength &&
                  readInterval(table, 0) == row.running && table.GetTimeElapsed() == elapsed;
    // An interval that was closed during the reading may be there in part.
    kept.elapsed = table.GetTimeElapsed() < elapsed ? 0 : elapsed;
    kept.readAt = m_now;
    ++m_readSince;
}

/// The intervals that a table which does not count them has closed: from the time that has passed.
void LineHistories::countIntervals(Kept& kept, int elapsed) const {
    auto const passed = std::chrono::duration_cast<std::chrono::seconds>(m_now - kept.readAt);
    std::int64_t const outside = passed.count() + kept.formerElapsed - elapsed;
    constexpr std::int64_t kLength = DS1IntervalTable::kIntervalLength;
    kept.allIntervals += std::max<std::int64_t>((outside + kLength / 2) / kLength, 0);
    kept.formerElapsed = elapsed;
}

bool LineHistories::isUnchanged(Kept const& kept, DS1IntervalTable& table, int elapsed) const {
    // A table that is closing an interval, or does not tell the time, tells nothing either.
    if (kept.elapsed <= 0 || elapsed < kept.elapsed || m_now - kept.readAt > kLongestGap)
        return false;
    auto const& counts = kept.closed->counts;
    return counts.size() == static_cast<std::size_t>(closedOf(table)) &&
           (counts.empty() || kept.elapsed > kCorrected ||
            counts.front() == readInterval(table, 1));
}

} // namespace kvloamd
