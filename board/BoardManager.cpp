// SPDX-License-Identifier: BSD-2-Clause
#include "board/BoardManager.h"

#include <utility>

BoardManager::BoardManager()
    : Object(false),
      m_boards(new BoardTable),
      m_factories(new kvlvector<ReferenceCounter<BoardFactory>>) {}

BoardManager::~BoardManager() {
    // Factories outlive the manager: a later event must not meet a dead listener.
    for (auto const& factory : *m_factories.get())
        factory->RemoveBoardStatusListener(this);
}

ReferenceCounter<Board> BoardManager::GetFirstBoard() {
    BoardTable* const boards = m_boards.get();
    ObjectGuard const guard(*boards);
    return (*boards)[boards->first_index()];
}

ReferenceCounter<Board> BoardManager::GetNextBoard(int index) {
    BoardTable* const boards = m_boards.get();
    ObjectGuard const guard(*boards);
    auto entry = boards->entries().find(index);
    if (entry == boards->entries().end() || ++entry == boards->entries().end()) return {};
    return entry->second;
}

ReferenceCounter<Board> BoardManager::GetNextBoard(ReferenceCounter<Board> board) {
    return GetNextBoard(GetIndexByBoard(std::move(board)));
}

ReferenceCounter<Board> BoardManager::GetBoardByIndex(int index) {
    BoardTable* const boards = m_boards.get();
    // The entry must not go before it is copied.
    ObjectGuard const guard(*boards);
    return (*boards)[index];
}

int BoardManager::GetNumberOfBoards() {
    BoardTable* const boards = m_boards.get();
    ObjectGuard const guard(*boards);
    return static_cast<int>(boards->entries().size());
}

int BoardManager::GetFirstBoardIndex() {
    return m_boards->first_index();
}

int BoardManager::GetIndexByBoard(ReferenceCounter<Board> board) {
    BoardTable* const boards = m_boards.get();
    Board* const wanted = board.get();
    ObjectGuard const guard(*boards);
    for (auto const& [index, entry] : boards->entries())
        if (entry.get() == wanted) return index;
    return 0;
}

int BoardManager::GetNextBoardIndex(int index) {
    return m_boards->next_index(index);
}

int BoardManager::Attach(ReferenceCounter<BoardFactory> factory) {
    factory->AddBoardStatusListener(this);
    m_factories->push_back(factory);
    factory->Initialize(m_boards);
    return 0;
}

int BoardManager::AddBoardStatusListener(BoardStatusListener* listener) {
    return m_listeners.AddListener(listener);
}

int BoardManager::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    KVL::deliver_board_status(m_listeners, nullptr, event);
    return 0;
}
