// SPDX-License-Identifier: BSD-2-Clause
// Reads all boards of a board manager.
#pragma once

#include <mutex>
#include <set>
#include <vector>

#include "agent/rows/BoardRow.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// Callable from any thread; its lock is never held while a board is asked.
class BoardSource {
  public:
    /// `manager` outlives the source.
    explicit BoardSource(BoardManager& manager) : m_manager(manager) {}

    /// The boards, ascending by index, each read once. Boards that come or go meanwhile may or may
    /// not be among them; no other board is missed.
    std::vector<BoardRow> read();

    /// The board of `index` has been announced as removed. A factory says so before it takes the
    /// board out of the table, so from now on `read` leaves it out whatever the table holds.
    void boardHasGone(int index);

  private:
    std::vector<int> indices();
    void forgetGoneBoards(std::vector<int> const& indices);
    bool hasGone(int index);

    BoardManager& m_manager;
    std::mutex m_mutex;
    std::set<int> m_gone; ///< announced as removed; out again once the table is without them
};

} // namespace kvloamd
