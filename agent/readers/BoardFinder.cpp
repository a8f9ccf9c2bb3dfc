// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardFinder.h"

#include <algorithm>
#include <cstdint>
#include <vector>

#include "access/DevMapBoardIf.h"
#include "agent/readers/Answers.h"
#include "agent/rows/BoardRow.h"

namespace kvloamd {

namespace {

constexpr int kFirstCapacity = 256;
constexpr int kLargestCapacity = 1 << 20;

/// The handles of all boards; nothing when the search fails. The library's own list ends at 100.
std::optional<std::vector<long>> listBoards() {
    DeviceMapperClient* const client = DeviceMapperIf::get_interface()->GetDMClient();
    long root = 0;
    if (client->GetRootObject(&root) != 0) return std::nullopt;
    std::vector<long> boards;
    for (int capacity = kFirstCapacity;; capacity *= 2) {
        std::int32_t type = DMObjectTypeBoard;
        DMAttribute criterion{"TYPE", &type, 0, 0, sizeof type};
        int found = capacity;
        boards.resize(static_cast<std::size_t>(capacity));
        if (client->FindObjects(root, 1, &criterion, &found, boards.data()) != 0)
            return std::nullopt;
        boards.resize(static_cast<std::size_t>(std::clamp(found, 0, capacity)));
        // A full array may be a part of the answer only.
        if (found < capacity || capacity == kLargestCapacity) return boards;
    }
}

} // namespace

BoardFinder::BoardFinder() {
    auto const boards = listBoards();
    m_good = boards.has_value();
    if (!m_good) return;
    for (long const board : *boards) {
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
    // One that is that of several boards, or of none, is no serial number either.
    if (found == m_driverBoards.end() || !find(found->second)) return std::nullopt;
    return found->second;
}

} // namespace kvloamd
