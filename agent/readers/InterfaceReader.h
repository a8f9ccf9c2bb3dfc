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
#include "agent/readers/SettledTotals.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Uptime.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// An `InterfaceReader` gives interfaces their indices, extends their counters beyond 32 bits, and
/// notes when interfaces appear and disappear. Thread-bound: the collector.
///
/// A counter must be read at least once in 2^32 counts. A counter that has fallen further than it
/// can have wrapped has begun again at 0: so do its 64 bits, and the interface's counters have a
/// discontinuity.
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
    /// How far an interface's counters have come.
    struct Counted {
        std::uint32_t boardIndex = 0; ///< a board that comes back has another
        std::uint32_t since = 0;
        decltype(InterfaceRow::counters) counters;
        decltype(EthernetRow::counters) ethernet;
        std::optional<int> operStatus;
        std::uint32_t lastChange = 0; ///< of `operStatus`
        std::uint64_t reading = 0;    ///< the last that found the interface
        Clock::time_point readAt;
    };

    void append(InterfaceRows& all, BoardInterfaces&& board,
                std::vector<std::uint32_t> const& indices, std::uint32_t boardIndex);
    /// Extends the counters of the interface that gets `ifIndex`. `ethernet`: null if it is none.
    void countOn(InterfaceRow& row, std::uint32_t ifIndex, EthernetRow* ethernet,
                 Clock::time_point now);
    /// Says when the row's ifOperStatus changed, whatever else of the interface has changed.
    void noteOperStatus(InterfaceRow& row, Counted& counted, Clock::time_point now) const;
    void noteChanges(InterfaceRows& all);

    BoardManager& m_manager;
    StableIndices& m_indices;
    Uptime const m_uptime;
    ChangeTimes m_changeTimes;
    LineHistories m_histories;
    AllSettledTotals m_lineTotals;
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
