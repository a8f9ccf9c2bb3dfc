// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardFinder.h"

#include <vector>

#include "access/DevMapBoardIf.h"
#include "agent/readers/Answers.h"
#include "agent/rows/BoardRow.h"

namespace kvloamd {

BoardFinder::BoardFinder() {
    std::vector<long> boards;
    m_good = DeviceMapperIf::get_interface()->FindAllBoards(boards);
    for (long const board : boards) {
        DevMapBoardIf const record(board);
        std::string const serialNumber = printable(record.SerialNumber());
        auto const [place, isNew] = m_handles.emplace(serialNumber, board);
        if (!isNew) place->second.reset();
        auto const [driver, isNewDriver] =
            m_driverBoards.emplace(record.VORNDriverBoardID(), serialNumber);
        if (!isNewDriver) driver->second.clear();
    }
    m_driverBoards.erase(-1);
    // These are no serial numbers, even when only one board is without.
    m_handles.erase("unknown");
    m_handles.erase("");
}

std::optional<long> BoardFinder::find(std::string const& serialNumber) const {
    auto const found = m_handles.find(serialNumber);
    return found == m_handles.end() ? std::nullopt : found->second;
}

std::optional<std::string> BoardFinder::serialNumberOfDriverBoard(long driverBoard) const {
    auto const found = m_driverBoards.find(driverBoard);
    // A number that several boards have, or none, does not identify a board.
    if (found == m_driverBoards.end() || !find(found->second)) return std::nullopt;
    return found->second;
}

} // namespace kvloamd
