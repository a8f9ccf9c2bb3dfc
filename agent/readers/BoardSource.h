// SPDX-License-Identifier: BSD-2-Clause
// Reads all boards of a board manager.
#pragma once

#include <cstdint>
#include <map>
#include <mutex>
#include <set>
#include <vector>

#include "agent/rows/BoardRow.h"
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
    /// `manager` outlives the source.
    explicit BoardSource(BoardManager& manager) : m_manager(manager) {}

    /// The boards, ascending by index, each read once. Boards that are inserted or removed
    /// meanwhile may or may not be among them; no other board is missed.
    std::vector<BoardRow> read();

    /// The removal of the board of `index` has been announced. Because a factory announces it
    /// before it takes the board out of the table, `read` leaves the board out from now on.
    void boardHasGone(int index);

  private:
    std::vector<int> indices();
    void forgetGoneBoards(std::vector<int> const& indices);
    bool hasGone(int index);
    BoardRow readRow(Board& board, int index);

    BoardManager& m_manager;
    std::map<std::uint32_t, BoardRow> m_answered; ///< the last row of each board, by board index
    std::mutex m_mutex;
    std::set<int> m_gone; ///< announced as removed, but still in the table
};

} // namespace kvloamd
