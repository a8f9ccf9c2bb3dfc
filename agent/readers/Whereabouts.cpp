// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Whereabouts.h"

#include <cstddef>
#include <optional>

#include "agent/rows/RowFinder.h"

namespace kvloamd {

void noteWhereabouts(Snapshot& snapshot) {
    EntityRows& entities = snapshot.entities;
    auto const& boards = snapshot.boards;
    auto const& interfaces = snapshot.interfaces.interfaces;
    entities.ofBoards.assign(boards.size(), 0);
    entities.ofInterfaces.assign(interfaces.size(), 0);
    RowFinder const boardRows(boards);
    RowFinder const interfaceRows(interfaces);
    for (PhysicalRow const& entity : entities.physical->entities) {
        if (auto const board = boardRows.placeOf(entity.boardIndex))
            entities.ofBoards[*board] = entity.entity;
        else if (auto const port = interfaceRows.placeOf(entity.ifIndex))
            entities.ofInterfaces[*port] = entity.entity;
    }
    RowFinder const owners(boards);
    std::optional<std::size_t> owner;
    for (std::size_t place = 0; place < interfaces.size(); ++place) {
        if (entities.ofInterfaces[place] != 0) continue;
        std::uint32_t const boardIndex = interfaces[place].boardIndex;
        // A board's interfaces are neighbours.
        if (!owner || boards[*owner].boardIndex != boardIndex) owner = owners.placeOf(boardIndex);
        if (owner) entities.ofInterfaces[place] = entities.ofBoards[*owner];
    }
}

} // namespace kvloamd
