// SPDX-License-Identifier: BSD-2-Clause
// Reads all boards' lines, channels and interfaces.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <unordered_map>
#include <vector>

#include "agent/readers/BoardInterfaces.h"
#include "agent/readers/BoardKeys.h"
#include "agent/readers/BoardTurns.h"
#include "agent/readers/ChangeTimes.h"
#include "agent/readers/DistinctNames.h"
#include "agent/readers/JoinedInterfaces.h"
#include "agent/readers/PerBoard.h"
#include "agent/readers/PlacedLine.h"
#include "agent/readers/SettledTotals.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Rows.h"
#include "agent/rows/Uptime.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// An `InterfaceReader` gives interfaces their indices, extends their counters beyond 32 bits, and
/// notes when interfaces appear and disappear. Thread-bound: the collector.
///
/// It reads a board in full when it is due by the turns, when the board has anything besides lines
/// or lines that count traffic, and when a short check finds a line that has changed. Of all other
/// boards it reads only the histories of lines that have counted. Whatever is as before shares its
/// rows with the reading before.
///
/// A counter must be read at least once in 2^32 counts. A counter that has fallen further than it
/// can have wrapped has begun again at 0: so do its 64 bits, and the interface's counters have a
/// discontinuity.
class InterfaceReader {
  public:
    /// `manager`, `indices` and `turns` outlive the reader. `started`: the agent's start. The
    /// reader adds the boards that it finds changed to `turns`; without turns it reads all boards
    /// in full.
    InterfaceReader(BoardManager& manager, StableIndices& indices, Clock::time_point started,
                    BoardTurns* turns = nullptr, Clocks clocks = {});
    InterfaceReader(InterfaceReader const&) = delete;
    InterfaceReader& operator=(InterfaceReader const&) = delete;

    /// The rows of `boards`, which are ascending by index.
    InterfaceRows read(Rows<BoardRow> const& boards);
    /// The lines of the last reading.
    std::vector<PlacedLine> const& lines() const { return m_lines; }

    /// When lines changed.
    ChangeTimes& changeTimes() { return m_changeTimes; }

  private:
    /// How far an interface's counters have come.
    struct Counted {
        std::uint32_t since = 0;
        decltype(InterfaceRow::counters) counters;
        decltype(EthernetRow::counters) ethernet;
        std::optional<int> operStatus;
        std::uint32_t lastChange = 0; ///< of `operStatus`
        std::uint64_t reading = 0;    ///< the last that found the interface
        Clock::time_point readAt;
    };
    using LineRows = std::vector<LineRow>;
    /// A board as it was read last. New while it has no rows.
    struct KnownBoard {
        std::uint32_t boardIndex = 0;
        BoardKey key;
        std::string name;         ///< in the names of its interfaces
        std::string serialNumber; ///< as its interfaces have it
        /// All tables except for the lines'.
        std::shared_ptr<BoardInterfaceRows const> rows;
        std::shared_ptr<BoardInterfaceRows const> joined; ///< `rows` as the joined tables have them
        std::shared_ptr<LineRows const> lines;
        std::vector<KnownLine> lineObjects; ///< in the order of `lines`
        BoardTexts texts; ///< before they are made different, in order of rows; empty: no rows
        std::unordered_map<std::uint32_t, Counted> counted; ///< by ifIndex
        /// It has only lines, which count nothing but their histories, and all have an index.
        bool isShareable = false;
    };
    /// The indices of the boards that have changed since the previous reading, by what has changed.
    struct Changes {
        std::set<std::uint32_t> tables;
        std::set<std::uint32_t> lineObjects;
        std::set<std::uint32_t> texts;
    };

    void readBoard(KnownBoard& known, BoardRow const& row, BoardKey const& key);
    void readFully(KnownBoard& known, BoardRow const& row);
    /// Reads what the lines have counted. Returns whether that is all that has changed.
    bool readCounts(KnownBoard& known);
    void drop(KnownBoard& known);
    void place(KnownBoard& known, BoardInterfaces&& found,
               std::vector<std::uint32_t> const& indices, BoardRow const& row);
    void placeLines(KnownBoard& known, BoardInterfaces& found,
                    std::vector<std::uint32_t> const& indices, std::uint32_t boardIndex);
    void placeTables(KnownBoard& known, BoardInterfaceRows&& placed);
    void showLines(KnownBoard& known, LineRows&& rows);
    /// Makes the names and descriptions of all boards' interfaces different from each other.
    /// `anew`: names all boards' interfaces, not only those of boards that have changed.
    void distinguish(bool anew);
    void distinguish(KnownBoard& known);
    /// Updates the tables of all boards. `anew`: puts them together from all boards again, instead
    /// of exchanging the rows of boards that have changed.
    void join(bool anew);
    /// The same for the list of lines.
    void joinLineObjects(bool anew);
    /// Extends the counters of the interface that gets `ifIndex`. `ethernet`: null if it is none.
    void countOn(InterfaceRow& row, Counted& counted, bool isNew, EthernetRow* ethernet,
                 Clock::time_point now);
    /// Says when the row's ifOperStatus changed, whatever else of the interface has changed.
    void noteOperStatus(InterfaceRow& row, Counted& counted, Clock::time_point now) const;

    BoardManager& m_manager;
    StableIndices& m_indices;
    BoardTurns* m_turns;
    Clocks const m_clocks;
    Uptime const m_uptime;
    ToTicks const m_toTicks;
    ChangeTimes m_changeTimes;
    LineHistories m_histories;
    AllSettledTotals m_lineTotals;
    KnownBoardKeys m_keys;
    PerBoard<KnownBoard> m_boards;
    Changes m_changes; ///< in this reading
    DistinctNames m_names;
    JoinedInterfaces m_joined;
    std::vector<PlacedLine> m_lines;
    std::uint64_t m_reading = 0; ///< which one this is
    bool m_read = false;
    bool m_anew = true; ///< nothing that was joined before can be used
};

} // namespace kvloamd
