// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceStates.h"

#include <algorithm>
#include <unordered_map>

#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// The layers of a stack are fewer; a stack that has more, or is a ring, is followed no further.
constexpr int kMostLayers = 8;

/// Whether an interface in this state carries nothing for those that stand on it.
bool isDead(std::optional<int> status) {
    return status && (isDown(*status) || *status == kTesting || *status == kNotPresent);
}

/// Whether an interface can be lowerLayerDown.
bool mayFollow(InterfaceRow const& row) {
    return row.adminStatus == kUp && row.operStatus != kNotPresent &&
           row.operStatus != kLowerLayerDown;
}

} // namespace

void completeStates(BoardInterfaceRows& rows) {
    std::unordered_map<std::uint32_t, InterfaceRow*> interfaces;
    for (InterfaceRow& row : rows.interfaces) {
        if (!row.adminStatus) row.adminStatus = kUp;
        if (!row.operStatus) row.operStatus = kUnknownStatus;
        row.linkUpDownTraps = row.type == kTypeDs0 ? kDisabled : kEnabled;
        interfaces.emplace(row.ifIndex, &row);
    }
    std::unordered_map<std::uint32_t, std::vector<InterfaceRow const*>> lower;
    for (StackRow const& row : rows.stack) {
        auto const above = interfaces.find(row.higher);
        auto const below = interfaces.find(row.lower);
        if (above == interfaces.end() || below == interfaces.end()) continue;
        above->second->linkUpDownTraps = kDisabled;
        lower[row.higher].push_back(below->second);
    }
    bool changed = true;
    for (int layer = 0; changed && layer < kMostLayers; ++layer) {
        changed = false;
        for (auto const& [index, below] : lower) {
            InterfaceRow& row = *interfaces.at(index);
            if (!mayFollow(row) || !std::ranges::all_of(below, isDead, &InterfaceRow::operStatus))
                continue;
            row.operStatus = kLowerLayerDown;
            changed = true;
        }
    }
}

} // namespace kvloamd
