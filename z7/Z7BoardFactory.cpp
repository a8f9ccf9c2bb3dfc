// SPDX-License-Identifier: BSD-2-Clause
#include "z7/Z7BoardFactory.h"

#include <cstddef>
#include <cstdint>
#include <ctime>

#include <limits>
#include <string>
#include <utility>

#include "access/DevMapBoardIf.h"

namespace {

/// Every board in a factory's map was created by `MakeBoard`.
Z7Board* z7(ReferenceCounter<Board> const& board) {
    return static_cast<Z7Board*>(board.unlocked());
}

std::string serialNumberOf(Z7Board& board) {
    char text[256];
    board.GetSerialNumber(text);
    return text;
}

} // namespace

Z7BoardFactory::Z7BoardFactory() : KVLThread_pthread(static_cast<Runnable*>(this)) {}

Z7BoardFactory::~Z7BoardFactory() = default;

int Z7BoardFactory::Initialize(ReferenceCounter<BoardTable> table) {
    m_self = ReferenceCounter<BoardFactory>(this);
    AttachBoardTable(std::move(table));
    std::vector<long> const identifiers = GetBoardIdentifiers();
    RefreshBoardData();
    for (long const id : identifiers)
        create_board(id);
    m_eventAdaptor = ExternalEventAdaptor::get_instance();
    m_eventAdaptor->AddExternalEventListener(this);
    if (m_pingInterval > 0) Start();
    return 0;
}

int Z7BoardFactory::AttachBoardTable(ReferenceCounter<BoardTable> table) {
    ObjectGuard const guard(*this);
    // The argument now holds the former table and drops it after the lock is released.
    std::swap(m_boardTable, table);
    return 0;
}

int Z7BoardFactory::Update() {
    return -1;
}

int Z7BoardFactory::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    BoardStatusEvent* const change = event.operator->();
    NotifyBoardStatusListeners(change->GetBoard(), change->GetBoardStatus());
    return 0;
}

int Z7BoardFactory::SetPingInterval(int seconds) {
    m_pingInterval = seconds;
    return 0;
}

int Z7BoardFactory::ProcessExternalEvent(ReferenceCounter<ExternalEvent> event) {
    ExternalEvent* const message = event.operator->();
    std::uint32_t const id = message->GetEventID();
    long const board = message->GetData();
    if (id == AdminBoardStarted || id == AdminBoardGone || id == AdminAllStarted)
        check_for_changed_boards();
    switch (id) {
    case AdminAllStarted:
        notify_all_boards(BoardStatusStarted);
        break;
    case AdminAllStopped:
        notify_all_boards(BoardStatusStopped);
        break;
    case AdminAllStartPending:
        notify_all_boards(BoardStatusStartPending);
        break;
    case AdminAllStopPending:
        notify_all_boards(BoardStatusStopPending);
        break;
    case AdminBoardGone:
    case AdminBoardStopped:
        notify_board(board, BoardStatusStopped);
        break;
    case AdminBoardFailed:
        notify_board(board, BoardStatusFailed);
        break;
    case AdminBoardStarted:
        notify_board(board, BoardStatusStarted);
        break;
    case AdminBoardStartPending:
        notify_board(board, BoardStatusStartPending);
        break;
    case AdminBoardStopPending:
        notify_board(board, BoardStatusStopPending);
        break;
    default:
        break;
    }
    return 0;
}

Z7BoardFactory::BoardMap Z7BoardFactory::copyBoards() {
    ObjectGuard const guard(*this);
    return m_boards;
}

ReferenceCounter<Board> Z7BoardFactory::findBoard(long id) {
    ObjectGuard const guard(*this);
    auto const found = m_boards.find(id);
    if (found == m_boards.end()) return {};
    return found->second;
}

int Z7BoardFactory::create_board(long id) {
    ReferenceCounter<Board> const board(MakeBoard(id));
    if (board.get() == nullptr) return -1;
    ReferenceCounter<BoardTable> table;
    {
        ObjectGuard const guard(*this);
        table = m_boardTable;
    }
    enter_at_next_index(*table.operator->(), board);
    {
        ObjectGuard const guard(*this);
        m_boards.insert_or_assign(id, board);
    }
    NotifyBoardStatusListeners(board, BoardStatusAdded);
    board->AddBoardStatusListener(this);
    return 0;
}

void Z7BoardFactory::dropBoard(long id, ReferenceCounter<Board> const& board) {
    NotifyBoardStatusListeners(board, BoardStatusRemoved);
    ObjectGuard const guard(*this);
    m_boards.erase(id);
    m_boardTable->remove(board);
}

int Z7BoardFactory::check_for_changed_boards() {
    DeviceMapperIf::get_interface();
    BoardMap gone = copyBoards();
    std::vector<long> added;
    for (long const id : GetBoardIdentifiers())
        if (gone.erase(id) == 0) added.push_back(id);
    for (auto const& [id, board] : gone)
        dropBoard(id, board);
    for (auto const& [id, board] : copyBoards()) {
        if (DevMapBoardIf(id).SerialNumber() == serialNumberOf(*z7(board))) continue;
        dropBoard(id, board);
        added.push_back(id);
    }
    for (long const id : added)
        create_board(id);
    return 0;
}

int Z7BoardFactory::notify_board(long id, BoardStatusEnum status) {
    ReferenceCounter<Board> const board = findBoard(id);
    if (Z7Board* const known = z7(board)) known->ProcessExternalEvent(status);
    return -1;
}

int Z7BoardFactory::notify_all_boards(BoardStatusEnum status) {
    // A few handles at a time: a chassis of thousands would otherwise walk through megabytes twice.
    constexpr std::size_t kAtATime = 32;
    std::vector<ReferenceCounter<Board>> boards;
    boards.reserve(kAtATime);
    for (long last = std::numeric_limits<long>::min();;) {
        boards.clear();
        {
            ObjectGuard const guard(*this);
            auto entry = m_boards.upper_bound(last);
            for (; entry != m_boards.end() && boards.size() < kAtATime; ++entry) {
                boards.push_back(entry->second);
                last = entry->first;
            }
        }
        if (boards.empty()) return -1;
        for (auto const& board : boards)
            z7(board)->ProcessExternalEvent(status);
    }
}

int Z7BoardFactory::ping_boards() {
    BoardMap const boards = copyBoards();
    RefreshBoardData();
    for (auto const& [id, board] : boards)
        z7(board)->PingBoard();
    return 0;
}

void Z7BoardFactory::Run() {
    std::time_t start = std::time(nullptr);
    for (;;) {
        // Deliberate: after a pass that takes longer than the interval this is negative, and the
        // sleep very long. Operators recognise an overloaded platform by the silent ping thread.
        Sleep(static_cast<int>(start + m_pingInterval - std::time(nullptr)));
        start = std::time(nullptr);
        ping_boards();
    }
}
