// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultListener.h"

#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardReader.h"
#include "agent/rows/BoardRow.h"
#include "board/Board.h"

namespace kvloamd {

int FaultListener::ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) {
    ExternalFaultEvent* const received = event.get();
    if (received == nullptr) return 0;
    {
        std::scoped_lock const guard(m_mutex);
        if (m_stopped) return 0;
    }
    FaultChange change;
    change.raised = received->GetEventID() == FaultRaised;
    change.platformBoard = received->GetBoardID();
    change.value = received->GetFault();
    enter(change);
    if (m_observer) m_observer(change);
    m_queue.push(faultNotification(m_enterprise, change));
    notifyChanged();
    return 0;
}

int FaultListener::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    BoardStatusEvent* const received = event.get();
    if (received == nullptr) return 0;
    ReferenceCounter<Board> const handle = received->GetBoard();
    Board* const board = handle.get();
    if (board == nullptr) return 0;
    int const index = indexOf(handle);
    if (index == 0) return 0;
    if (received->GetBoardStatus() == BoardStatusRemoved) {
        forgetBoard(index);
        notifyChanged();
    } else {
        noteBoard({index, readSerialNumber(*board), unlessNegative(board->GetLogicalID())});
    }
    return 0;
}

int FaultListener::indexOf(ReferenceCounter<Board> const& board) {
    // The manager searches its whole table. While the agent starts, thousands of boards appear one
    // after the other, each under the next index.
    int const newest = m_newest;
    for (int const index : {newest, newest + 1}) {
        if (m_manager.GetBoardByIndex(index).get() != board.get()) continue;
        m_newest = index;
        return index;
    }
    int const index = m_manager.GetIndexByBoard(board);
    if (index > newest) m_newest = index;
    return index;
}

void FaultListener::start(std::function<void()> changed) {
    std::scoped_lock const guard(m_mutex);
    m_changed = std::move(changed);
}

void FaultListener::stop() {
    std::scoped_lock const guard(m_mutex);
    m_stopped = true;
    m_changed = nullptr;
}

void FaultListener::enter(FaultChange& change) {
    std::scoped_lock const guard(m_boardsMutex);
    if (KnownBoard const* const board = find(change.platformBoard)) {
        change.boardIndex = board->index;
        change.serialNumber = board->serialNumber;
    }
    auto const index = static_cast<std::uint32_t>(change.boardIndex);
    if (change.raised)
        m_faults.raise(index, change.platformBoard, change.value);
    else
        m_faults.clear(index, change.platformBoard, change.value);
}

void FaultListener::noteBoard(KnownBoard board) {
    std::scoped_lock const guard(m_boardsMutex);
    m_finder.reset();
    if (board.logicalId)
        m_faults.boardIsKnown(static_cast<std::uint32_t>(board.index), *board.logicalId);
    m_boards[board.index] = std::move(board);
}

void FaultListener::forgetBoard(int index) {
    std::scoped_lock const guard(m_boardsMutex);
    m_finder.reset();
    m_boards.erase(index);
    m_faults.boardHasGone(static_cast<std::uint32_t>(index));
}

FaultListener::KnownBoard const* FaultListener::find(int platformBoard) {
    bool allHaveLogicalIds = true;
    for (auto const& [index, board] : m_boards) {
        if (board.logicalId == platformBoard) return &board;
        allHaveLogicalIds = allHaveLogicalIds && board.logicalId.has_value();
    }
    if (allHaveLogicalIds) return nullptr;
    if (!m_finder) m_finder.emplace();
    auto const found = m_finder->serialNumberOfDriverBoard(platformBoard);
    if (!found) return nullptr;
    for (auto const& [index, board] : m_boards)
        if (!board.logicalId && board.serialNumber == *found) return &board;
    return nullptr;
}

void FaultListener::notifyChanged() {
    std::scoped_lock const guard(m_mutex);
    if (m_changed) m_changed();
}

} // namespace kvloamd
