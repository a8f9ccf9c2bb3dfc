// SPDX-License-Identifier: BSD-2-Clause
#include "board/BoardManager.h"

#include <utility>

#include "core/TableWalk.h"

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
    return KVL::first_entry(*m_boards.unlocked());
}

ReferenceCounter<Board> BoardManager::GetNextBoard(int index) {
    return KVL::entry_after(*m_boards.unlocked(), index);
}

ReferenceCounter<Board> BoardManager::GetNextBoard(ReferenceCounter<Board> board) {
    return GetNextBoard(GetIndexByBoard(std::move(board)));
}

ReferenceCounter<Board> BoardManager::GetBoardByIndex(int index) {
    return KVL::entry_at(*m_boards.unlocked(), index);
}

int BoardManager::GetNumberOfBoards() {
    return KVL::number_of_entries(*m_boards.unlocked());
}

int BoardManager::GetFirstBoardIndex() {
    return m_boards.unlocked()->first_index();
}

int BoardManager::GetIndexByBoard(ReferenceCounter<Board> board) {
    return KVL::index_of(*m_boards.unlocked(), board);
}

int BoardManager::GetNextBoardIndex(int index) {
    return m_boards.unlocked()->next_index(index);
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
