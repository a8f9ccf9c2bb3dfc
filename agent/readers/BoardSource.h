// SPDX-License-Identifier: BSD-2-Clause
// Reads all boards of a board manager.
#pragma once

#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <set>
#include <vector>

#include "agent/readers/BoardTurns.h"
#include "agent/readers/PerBoard.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/Rows.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// A `BoardSource` reads the rows of all boards.
///
/// A board that throws is shown as not answering: with what it answered last, without a status,
/// and with the exception as its error message.
///
/// `boardHasGone` is thread-safe; its lock is never held while a board is read. `read` is
/// thread-bound: the collector.
class BoardSource {
  public:
    /// `manager` and `turns` outlive the source. The source begins a refresh of `turns` with every
    /// reading, and adds the boards whose status, features or date of change are others than
    /// before. Without turns it reads every board in full.
    explicit BoardSource(BoardManager& manager, BoardTurns* turns = nullptr)
        : m_manager(manager), m_turns(turns) {}

    /// The boards, ascending by index, each read once. Boards that are inserted or removed
    /// meanwhile may or may not be among them; no other board is missed. A board that has not
    /// changed shares its row with the reading before.
    Rows<BoardRow> read();

    /// The removal of the board of `index` has been announced. Because a factory announces it
    /// before it takes the board out of the table, `read` leaves the board out from now on.
    void boardHasGone(int index);

  private:
    /// What a short check compares.
    struct Check {
        BoardStatusEnum status;
        BoardStatusEnum secondaryStatus;
        int features;
        long changeDate;

        bool operator==(Check const&) const = default;
    };
    struct Known {
        ReferenceCounter<Board> board;
        std::shared_ptr<BoardRow const> answered; ///< the last answers; null: there were none
        std::shared_ptr<BoardRow const> shown;    ///< the same, while the board answers
        std::optional<Check> check;               ///< nothing: the board did not answer
    };

    std::vector<int> indices();
    void forgetGoneBoards(std::vector<int> const& indices);
    std::set<int> goneBoards();
    void readRow(Board& board, int index, Known& known);
    static bool hasChanged(Board& board, Check const& before);
    static Check check(Board& board);

    BoardManager& m_manager;
    BoardTurns* m_turns;
    PerBoard<Known> m_known;
    Rows<BoardRow> m_rows; ///< of the last reading
    std::mutex m_mutex;
    std::set<int> m_gone; ///< announced as removed, but still in the table
};

} // namespace kvloamd
