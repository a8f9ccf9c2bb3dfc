// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Whereabouts.h"

#include <algorithm>
#include <vector>

namespace kvloamd {

namespace {

/// The row with this index; null if there is none.
template <class Row>
Row* find(std::vector<Row>& rows, std::uint32_t index) {
    auto const found =
        std::ranges::partition_point(rows, [&](Row const& row) { return row.index()[0] < index; });
    return found == rows.end() || found->index()[0] != index ? nullptr : &*found;
}

} // namespace

void noteWhereabouts(Snapshot& snapshot) {
    for (PhysicalRow const& entity : snapshot.entities.physical->entities) {
        if (BoardRow* const board = find(snapshot.boards, entity.boardIndex))
            board->entity = entity.entity;
        else if (InterfaceRow* const port = find(snapshot.interfaces.interfaces, entity.ifIndex))
            port->entity = entity.entity;
    }
    BoardRow const* board = nullptr;
    for (InterfaceRow& interface : snapshot.interfaces.interfaces) {
        // A board's interfaces are neighbours.
        if (board == nullptr || board->boardIndex != interface.boardIndex)
            board = find(snapshot.boards, interface.boardIndex);
        if (board == nullptr) continue;
        interface.boardSerialNumber = board->serialNumber;
        if (interface.entity == 0) interface.entity = board->entity;
    }
}

} // namespace kvloamd
