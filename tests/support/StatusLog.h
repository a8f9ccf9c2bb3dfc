// SPDX-License-Identifier: BSD-2-Clause
// A listener that records board status events.
#pragma once

#include <mutex>
#include <utility>
#include <vector>

#include "board/Board.h"

/// Thread-safe. Keeps the boards of the events alive until it is cleared.
class StatusLog final : public BoardStatusListener {
  public:
    struct Entry {
        BoardStatusEnum status;
        ReferenceCounter<Board> board;
        BoardStatusEvent* event; ///< to tell events apart; may be gone
    };

    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
        std::scoped_lock const guard(m_mutex);
        m_entries.push_back({event->GetBoardStatus(), event->GetBoard(), event.get()});
        return 0;
    }

    std::vector<Entry> entries() const {
        std::scoped_lock const guard(m_mutex);
        return m_entries;
    }

    std::vector<int> statuses() const {
        std::vector<int> all;
        for (auto const& entry : entries())
            all.push_back(entry.status);
        return all;
    }

    /// The recorded statuses of one board.
    std::vector<int> statusesOf(ReferenceCounter<Board> const& board) const {
        std::vector<int> some;
        for (auto const& entry : entries())
            if (entry.board.get() == board.get()) some.push_back(entry.status);
        return some;
    }

    void clear() {
        std::vector<Entry> dropped;
        std::scoped_lock const guard(m_mutex);
        m_entries.swap(dropped);
    }

  private:
    mutable std::mutex m_mutex;
    std::vector<Entry> m_entries;
};
