// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardKeys.h"

#include <algorithm>
#include <map>
#include <set>
#include <tuple>

namespace kvloamd {

namespace {

/// A place in the order of slots; unknown ones come last.
auto placeOf(BoardRow const& board) {
    auto const last = [](std::optional<int> number) {
        return std::pair(!number.has_value(), number.value_or(0));
    };
    return std::tuple(last(board.shelfId), last(board.busNumber), last(board.pciSlotNumber),
                      last(board.logicalId), board.boardIndex);
}

std::string placeName(BoardRow const& board) {
    if (std::string slot = slotName(board); !slot.empty()) return slot;
    return board.logicalId ? "logical id " + std::to_string(*board.logicalId) : std::string();
}

std::string knownSerialNumber(BoardRow const& board) {
    return board.serialNumber == "unknown" ? std::string() : board.serialNumber;
}

/// No text of the platform has this first character.
BoardKey passingKey(BoardRow const& board) {
    return {"\x01" + std::to_string(board.boardIndex), false};
}

} // namespace

std::string slotName(BoardRow const& board) {
    if (!board.pciSlotNumber) return {};
    std::string name;
    if (board.shelfId) name += "shelf " + std::to_string(*board.shelfId) + " ";
    if (board.busNumber) name += "bus " + std::to_string(*board.busNumber) + " ";
    return name + "slot " + std::to_string(*board.pciSlotNumber);
}

std::vector<BoardKey> boardKeys(Rows<BoardRow> const& boards) {
    std::map<std::string, BoardRow const*> owners;
    for (BoardRow const& board : boards) {
        auto const [owner, isNew] = owners.emplace(knownSerialNumber(board), &board);
        if (!isNew && placeOf(board) < placeOf(*owner->second)) owner->second = &board;
    }
    std::vector<BoardKey> keys;
    std::set<std::string> taken;
    for (BoardRow const& board : boards) {
        std::string const serialNumber = knownSerialNumber(board);
        if (!serialNumber.empty() && owners[serialNumber] == &board) {
            keys.push_back({serialNumber, true});
            continue;
        }
        std::string const place = placeName(board);
        std::string name = serialNumber + "@" + place;
        if (place.empty() || !taken.insert(name).second)
            keys.push_back(passingKey(board));
        else
            keys.push_back({std::move(name), true});
    }
    return keys;
}

std::vector<BoardKey> const& KnownBoardKeys::of(Rows<BoardRow> const& boards) {
    auto const isIdentifiedAs = [](BoardRow const& one, BoardRow const& other) {
        return &one == &other ||
               (one.boardIndex == other.boardIndex && one.serialNumber == other.serialNumber &&
                one.shelfId == other.shelfId && one.busNumber == other.busNumber &&
                one.pciSlotNumber == other.pciSlotNumber && one.logicalId == other.logicalId);
    };
    m_areAsBefore = std::ranges::equal(boards, m_boards, isIdentifiedAs);
    if (!m_areAsBefore) m_keys = boardKeys(boards);
    m_boards = boards;
    return m_keys;
}

} // namespace kvloamd
