// SPDX-License-Identifier: BSD-2-Clause
#include "board/BoardFactory.h"

#include <utility>

BoardFactory::BoardFactory() : Object(true) {}

BoardFactory::~BoardFactory() = default;

int BoardFactory::AddBoardStatusListener(BoardStatusListener* listener) {
    ObjectGuard const guard(*this);
    return m_listeners.AddListener(listener);
}

int BoardFactory::NotifyBoardStatusListeners(ReferenceCounter<Board> board,
                                             BoardStatusEnum status) {
    KVL::notify_board_status(m_listeners, this, std::move(board), status);
    return 0;
}

int BoardFactory::RemoveBoardStatusListener(BoardStatusListener* listener) {
    ObjectGuard const guard(*this);
    return m_listeners.RemoveListener(listener);
}
