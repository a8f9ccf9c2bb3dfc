// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/StatusListener.h"

#include <utility>

#include "agent/readers/BoardReader.h"
#include "board/Board.h"

namespace kvloamd {

int StatusListener::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    BoardStatusEvent* const received = event.get();
    if (received == nullptr) return 0;
    ReferenceCounter<Board> const board = received->GetBoard();
    Board* const changed = board.get();
    if (changed == nullptr) return 0;
    {
        std::scoped_lock const guard(m_mutex);
        if (m_phase == Phase::Stopped) return 0;
        if (m_phase == Phase::Starting && std::this_thread::get_id() == m_startingThread) return 0;
    }
    int const index = m_manager.GetIndexByBoard(board);
    // The board has left the table; its removal was reported before.
    if (index == 0) return 0;
    BoardStatusEnum const status = received->GetBoardStatus();
    if (status == BoardStatusRemoved) m_source.boardHasGone(index);
    ++m_counters.statusChanges;
    if (m_observer) m_observer(index, *changed, status);
    m_queue.push(boardStatusNotification(m_enterprise, index, readSerialNumber(*changed), status));
    std::scoped_lock const guard(m_mutex);
    if (m_phase == Phase::Running) m_changed();
    return 0;
}

void StatusListener::start(std::function<void()> changed) {
    std::scoped_lock const guard(m_mutex);
    m_phase = Phase::Running;
    m_changed = std::move(changed);
}

void StatusListener::stop() {
    std::scoped_lock const guard(m_mutex);
    m_phase = Phase::Stopped;
    m_changed = nullptr;
}

} // namespace kvloamd
