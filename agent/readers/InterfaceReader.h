// SPDX-License-Identifier: BSD-2-Clause
// Reads all boards' lines, channels and interfaces.
#pragma once

#include <cstdint>
#include <string>
#include <unordered_map>
#include <utility>
#include <vector>

#include "agent/readers/BoardInterfaces.h"
#include "agent/readers/ChangeTimes.h"
#include "agent/readers/PlacedLine.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Uptime.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// An `InterfaceReader` gives interfaces their indices, extends their counters beyond 32 bits, and
/// notes when interfaces appear and disappear. Thread-bound: the collector.
///
/// A counter must be read at least once in 2^32 counts. Counts that are lost because it was not, or
/// because a board has begun again at 0, cannot be recovered.
class InterfaceReader {
  public:
    /// `manager` and `indices` outlive the reader. `started`: the agent's start.
    InterfaceReader(BoardManager& manager, StableIndices& indices, Clock::time_point started);

    /// The rows of `boards`, which are ascending by index.
    InterfaceRows read(std::vector<BoardRow> const& boards);
    /// The lines of the last reading.
    std::vector<PlacedLine> takeLines() { return std::exchange(m_lines, {}); }

    /// When lines changed.
    ChangeTimes& changeTimes() { return m_changeTimes; }

  private:
    using Counters = decltype(InterfaceRow::counters);

    /// How far an interface's counters have come.
    struct Counted {
        std::uint32_t boardIndex; ///< a board that comes back has another
        std::uint32_t since;
        Counters counters;
        std::optional<int> operStatus;
        std::optional<std::uint32_t> lastChange; ///< of `operStatus`
        std::uint64_t reading;                   ///< the last that found the interface
    };

    void append(InterfaceRows& all, BoardInterfaces&& board,
                std::vector<std::uint32_t> const& indices, std::uint32_t boardIndex);
    void countOn(InterfaceRow& row, std::uint32_t boardIndex);
    /// Says when the row's ifOperStatus changed, whatever else of the interface has changed.
    void noteOperStatus(InterfaceRow& row, Counted& counted) const;
    void noteChanges(InterfaceRows& all);

    BoardManager& m_manager;
    StableIndices& m_indices;
    Uptime const m_uptime;
    ChangeTimes m_changeTimes;
    LineHistories m_histories;
    std::vector<PlacedLine> m_lines;
    std::unordered_map<std::uint32_t, Counted> m_counted; ///< by ifIndex
    std::uint64_t m_reading = 0;                          ///< which one this is
    bool m_read = false;
    std::vector<std::uint32_t> m_formerIndices;
    std::vector<StackRow> m_formerStack;
    std::size_t m_formerLines = 0;
    std::uint32_t m_lastChange = 0;
    std::uint32_t m_stackLastChange = 0;
};

} // namespace kvloamd
