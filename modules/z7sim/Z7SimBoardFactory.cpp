// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimBoardFactory.h"

#include <memory>
#include <utility>

#include "Z7SimBoard.h"
#include "access/DeviceMapperIf.h"

Z7SimBoardFactory::Z7SimBoardFactory() = default;

Z7SimBoardFactory::~Z7SimBoardFactory() = default;

std::vector<long> Z7SimBoardFactory::GetBoardIdentifiers() {
    std::vector<long> boards;
    bool const answered = DeviceMapperIf::get_interface()->FindAllBoards(boards);
    std::scoped_lock const guard(m_mutex);
    if (answered) m_identifiers = std::move(boards);
    return m_identifiers;
}

int Z7SimBoardFactory::RefreshBoardData() {
    return 0;
}

Z7Board* Z7SimBoardFactory::MakeBoard(long id) {
    auto board = std::make_unique<Z7SimBoard>(id, m_failureTimes);
    board->AdoptCondition();
    return board.release();
}

int Z7SimBoardFactory::NotifyBoardStatusListeners(ReferenceCounter<Board> board,
                                                  BoardStatusEnum status) {
    // A ping under way on the other thread must not announce a failure of a board that has gone.
    if (status == BoardStatusRemoved) static_cast<Z7SimBoard*>(board.get())->Retire();
    return Z7BoardFactory::NotifyBoardStatusListeners(std::move(board), status);
}
