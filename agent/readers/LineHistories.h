// SPDX-License-Identifier: BSD-2-Clause
// Reads the histories of lines, and of a day of closed intervals only what can have changed.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <unordered_map>

#include "agent/rows/Clock.h"
#include "agent/rows/InterfaceRows.h"
#include "board/DS1IntervalTable.h"
#include "board/DS1IntervalValidity.h"
#include "core/ReferenceCounter.h"

namespace kvloamd {

/// A closed interval stays what it is, except that the newest one may still be corrected for a
/// minute: so all are read when the table is new, when an interval has been closed and when the
/// newest is another than before. Keeps a table until the second `begin` after it was read last.
/// Unsynchronised.
class LineHistories {
  public:
    /// Begins to read all lines once more.
    void begin(Clock::time_point now);
    /// Whether the history has counted nothing since it filled the intervals of `row`, which then
    /// stand.
    bool stands(ReferenceCounter<DS1IntervalTable> const& handle, LineRow const& row);
    /// Fills the intervals of `row`.
    void read(ReferenceCounter<DS1IntervalTable> const& handle, LineRow& row);

  private:
    struct Kept {
        ReferenceCounter<DS1IntervalTable> table; ///< so that no other has its address
        DS1IntervalValidity* validity = nullptr;  ///< the table's; null where it has none
        int intervalsClosed = 0;                  ///< by the table, before `closed` was read
        std::shared_ptr<ClosedIntervals const> closed;
        int elapsed = 0;               ///< 0: an interval may have been closed meanwhile
        std::uint64_t number = 0;      ///< of the table, among all that were ever read
        std::int64_t allIntervals = 0; ///< closed by the table, as far as it lets one know
        int formerElapsed = 0;         ///< as read last
        Clock::time_point readAt;
    };

    bool isUnchanged(Kept const& kept, DS1IntervalTable& table, int elapsed) const;
    void countIntervals(Kept& kept, int elapsed) const;

    Clock::time_point m_now;
    std::size_t m_readSince = 0;  ///< tables, each once
    std::uint64_t m_numbered = 0; ///< tables
    std::unordered_map<DS1IntervalTable*, Kept> m_kept;
};

} // namespace kvloamd
