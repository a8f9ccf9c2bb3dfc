// SPDX-License-Identifier: BSD-2-Clause
#include "board/Board.h"

#include <utility>

#include "core/FindObject.h"

Board::Board() : Object(Adopt(), new KVLLockable_pthread(RecursiveLock)) {}

Board::~Board() = default;

namespace {

bool answersTo(ReferenceCounter<Feature> const& feature, KVL::IID const& iid) {
    Feature const* const object = feature.unlocked();
    return object != nullptr && object->interfaces()->is_element(iid);
}

} // namespace

int Board::AddBoardStatusListener(BoardStatusListener* listener) {
    ObjectGuard const guard(*this);
    return m_listeners.AddListener(listener);
}

int Board::NotifyBoardStatusListeners(ReferenceCounter<Board> board, BoardStatusEnum status) {
    KVL::notify_board_status(m_listeners, this, std::move(board), status);
    return 0;
}

int Board::GetFeatureListSize() {
    ObjectGuard const guard(*this);
    return static_cast<int>(m_features.size());
}

int Board::AddFeature(ReferenceCounter<Feature> feature) {
    ObjectGuard const guard(*this);
    m_features.push_back(std::move(feature));
    return 1;
}

int Board::RemoveFeature(ReferenceCounter<Feature> feature) {
    Feature const* const wanted = feature.get();
    ObjectGuard const guard(*this);
    auto const found = KVL::find_object(m_features, wanted);
    if (found == m_features.end()) return 0;
    m_features.erase(found);
    return 1;
}

ReferenceCounter<Feature> Board::GetFirstFeature(KVL::IID iid) {
    ObjectGuard const guard(*this);
    for (auto const& feature : m_features)
        if (answersTo(feature, iid)) return feature;
    return {};
}

ReferenceCounter<Feature> Board::GetNextFeature(ReferenceCounter<Feature> previous, KVL::IID iid) {
    Feature const* const wanted = previous.get();
    ObjectGuard const guard(*this);
    auto entry = KVL::find_object(m_features, wanted);
    if (entry == m_features.end()) return {};
    for (++entry; entry != m_features.end(); ++entry)
        if (answersTo(*entry, iid)) return *entry;
    return {};
}

BoardStatusEvent::BoardStatusEvent() = default;

BoardStatusEvent::BoardStatusEvent(BoardStatusEnum status, ReferenceCounter<Board>&& board)
    : m_status(status), m_board(std::move(board)) {}

BoardStatusEvent::~BoardStatusEvent() = default;

BoardStatusEnum BoardStatusEvent::GetBoardStatus() {
    return m_status;
}

ReferenceCounter<Board> BoardStatusEvent::GetBoard() {
    return m_board;
}

void BoardStatusEvent::SetBoardStatus(BoardStatusEnum status) {
    m_status = status;
}

void BoardStatusEvent::SetBoard(ReferenceCounter<Board> board) {
    m_board = std::move(board);
}

namespace KVL {

void notify_board_status(ListenerTable& listeners, Object* guard, ReferenceCounter<Board>&& board,
                         BoardStatusEnum status) {
    deliver_board_status(
        listeners, guard,
        ReferenceCounter<BoardStatusEvent>(new BoardStatusEvent(status, std::move(board))));
}

void deliver_board_status(ListenerTable& listeners, Object* guard,
                          ReferenceCounter<BoardStatusEvent> const& event) {
    for_each_listener<BoardStatusListener>(listeners, guard, [&](BoardStatusListener* listener) {
        listener->ProcessBoardStatusEvent(event);
    });
}

} // namespace KVL
