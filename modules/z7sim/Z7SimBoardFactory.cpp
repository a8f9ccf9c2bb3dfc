// SPDX-License-Identifier: BSD-2-Clause
#include "Z7SimBoardFactory.h"

#include <cstdint>

#include <algorithm>
#include <memory>
#include <utility>

#include "Z7SimBoard.h"
#include "access/DeviceMapperIf.h"

namespace {

constexpr int kFirstCapacity = 256;
constexpr int kLargestCapacity = 1 << 20;

/// Searches the root for all boards. False when the search fails.
bool findBoards(std::vector<long>& boards) {
    DeviceMapperClient* const client = DeviceMapperIf::get_interface()->GetDMClient();
    long root = 0;
    client->GetRootObject(&root);
    for (int capacity = kFirstCapacity;; capacity *= 2) {
        std::int32_t type = DMObjectTypeBoard;
        DMAttribute criterion{"TYPE", &type, 0, 0, sizeof type};
        int found = capacity;
        boards.resize(static_cast<std::size_t>(capacity));
        if (client->FindObjects(root, 1, &criterion, &found, boards.data()) != 0) return false;
        boards.resize(static_cast<std::size_t>(std::clamp(found, 0, capacity)));
        // A full array may be a part of the answer only.
        if (found < capacity || capacity == kLargestCapacity) return true;
    }
}

} // namespace

Z7SimBoardFactory::Z7SimBoardFactory() = default;

Z7SimBoardFactory::~Z7SimBoardFactory() = default;

std::vector<long> Z7SimBoardFactory::GetBoardIdentifiers() {
    std::vector<long> boards;
    bool const answered = findBoards(boards);
    std::scoped_lock const guard(m_mutex);
    if (answered) m_identifiers = std::move(boards);
    return m_identifiers;
}

int Z7SimBoardFactory::RefreshBoardData() {
    return 0;
}

Z7Board* Z7SimBoardFactory::MakeBoard(long id) {
    auto board = std::make_unique<Z7SimBoard>(id);
    board->AdoptCondition();
    return board.release();
}

int Z7SimBoardFactory::NotifyBoardStatusListeners(ReferenceCounter<Board> board,
                                                  BoardStatusEnum status) {
    // A ping under way on the other thread must not announce a failure of a board that has gone.
    if (status == BoardStatusRemoved) static_cast<Z7SimBoard*>(board.get())->Retire();
    return Z7BoardFactory::NotifyBoardStatusListeners(std::move(board), status);
}
