// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultListener.h"

#include <utility>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardReader.h"
#include "agent/rows/BoardRow.h"
#include "board/Board.h"

namespace kvloamd {

int FaultListener::ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) {
    ExternalFaultEvent* const told = event.get();
    if (told == nullptr) return 0;
    {
        std::scoped_lock const guard(m_mutex);
        if (m_stopped) return 0;
    }
    FaultNews news;
    news.raised = told->GetEventID() == FaultRaised;
    news.platformBoard = told->GetBoardID();
    news.value = told->GetFault();
    enter(news);
    m_queue.push(faultChange(m_enterprise, news));
    tellChanged();
    return 0;
}

int FaultListener::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    BoardStatusEvent* const told = event.get();
    if (told == nullptr) return 0;
    ReferenceCounter<Board> const handle = told->GetBoard();
    Board* const board = handle.get();
    if (board == nullptr) return 0;
    int const index = m_manager.GetIndexByBoard(handle);
    if (index == 0) return 0;
    if (told->GetBoardStatus() == BoardStatusRemoved) {
        forgetBoard(index);
        tellChanged();
    } else {
        noteBoard({index, readSerialNumber(*board), unlessNegative(board->GetLogicalID())});
    }
    return 0;
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

void FaultListener::enter(FaultNews& news) {
    std::scoped_lock const guard(m_boardsMutex);
    if (KnownBoard const* const board = find(news.platformBoard)) {
        news.boardIndex = board->index;
        news.serialNumber = board->serialNumber;
    }
    auto const index = static_cast<std::uint32_t>(news.boardIndex);
    if (news.raised)
        m_faults.raise(index, news.platformBoard, news.value);
    else
        m_faults.clear(index, news.platformBoard, news.value);
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

void FaultListener::tellChanged() {
    std::scoped_lock const guard(m_mutex);
    if (m_changed) m_changed();
}

} // namespace kvloamd
