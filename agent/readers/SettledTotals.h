// SPDX-License-Identifier: BSD-2-Clause
// Totals of a line's performance counters that never fall.
#pragma once

#include <algorithm>
#include <array>
#include <cstdint>
#include <optional>
#include <unordered_map>
#include <vector>

#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// A `SettledTotals` adds up what one line counts, from the readings of its history.
///
/// A history takes seconds back: when a line turns out to have been unavailable, its last seconds
/// become unavailable ones and lose their errors, and when it is available again the last
/// unavailable seconds become available ones. Both concern at most the last `kUnsettled` seconds.
/// The totals contain a second only when it cannot be taken back any more:
///
/// - An unavailable second can be taken back only while the line is unavailable, and only if it is
///   one of the last. So all are settled while the line is available, and all but the last
///   `kUnsettled` while it is not.
/// - Everything else can be taken back only when the line becomes unavailable, which adds
///   unavailable seconds. So what an available line had counted `kUnsettled` seconds ago is settled
///   if there are no more unavailable seconds now than there were then; and while the line is
///   unavailable everything is settled.
///
/// A reading may come at any time; more seldom readings settle later. A total of seconds grows by
/// no more than the time that has passed, so that no rate of it exceeds one second per second.
/// A line that does not tell its status has the totals of its closed intervals.
///
/// Counts from the first reading. A history that begins anew, as that of a board which was
/// pulled and inserted again, continues the totals. Unsynchronised.
class SettledTotals {
  public:
    /// In seconds of the line. A failure is declared at most 10 s after its defect, which at most
    /// nine severely errored seconds precede; it is cleared at most 20 s after the defect's end.
    static constexpr std::int64_t kUnsettled = 30;

    /// Reads `row`; one that `isWhole` is not is ignored. Returns the totals.
    LineTotals add(LineRow const& row);
    /// The line is not there now: keeps nothing but the totals.
    void rest();

  private:
    using Sums = std::array<std::int64_t, kLineCounters>;
    /// What had been counted at one time.
    struct Reading {
        std::int64_t time = 0; ///< in seconds of the line
        Sums counts{};
    };
    struct Counter {
        bool known = false;
        std::int64_t before = 0;             ///< the total of the histories before this one
        std::int64_t base = 0;               ///< what the history had counted at its first reading
        std::optional<std::int64_t> settled; ///< of what the history has counted

        /// Of the seconds that were not settled at the first reading, those that were taken back
        /// make up for later ones.
        std::int64_t total() const { return before + std::max<std::int64_t>(gain(), 0); }
        std::int64_t gain() const { return settled.value_or(base) - base; }
    };

    void beginAnew(LineRow const& row);
    bool continues(LineRow const& row) const;
    void archive(LineRow const& row);
    Sums countsOf(LineRow const& row) const;
    bool hasLost(Sums const& counts) const;
    void settle(Reading const& now, LineRow const& row);
    void settleAvailable(Reading const& now);
    void settleUnavailable(Reading const& now);
    void settleClosed(Reading const& now, LineRow const& row);
    void advance(std::size_t counter, std::int64_t to, std::int64_t passed);
    LineTotals totals() const;

    std::array<Counter, kLineCounters> m_counters;
    std::uint64_t m_history = 0; ///< whose readings these are; 0: none's
    std::int64_t m_closed = 0;   ///< intervals, at the last reading
    bool m_hadClosed = false;    ///< the last reading had a closed interval
    Sums m_archived{};           ///< the intervals before the newest closed one
    std::optional<Reading> m_last;
    bool m_wasUnavailable = false; ///< at the last reading
    /// Those since the line became available, as far as they are needed: the newest of those that
    /// are settled, and what follows it.
    std::vector<Reading> m_available;
};

/// The `SettledTotals` of all lines. Unsynchronised.
class AllSettledTotals {
  public:
    /// Reads `row` of the line that has `ifIndex`, and fills its totals.
    void add(std::uint32_t ifIndex, LineRow& row);
    /// The line is not there now.
    void rest(std::uint32_t ifIndex);

  private:
    std::unordered_map<std::uint32_t, SettledTotals> m_lines;
};

} // namespace kvloamd
