// SPDX-License-Identifier: BSD-2-Clause
// The named resources of boards as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace kvloamd {

enum class ResourceKind : int { Other = 1, Voice = 2, Trunk = 3, IsdnTrunk = 4, Station = 5 };

/// A `ResourceRow` is a row of kvlResourceDeviceTable. A number that the device does not know is
/// absent.
struct ResourceRow {
    std::uint32_t boardIndex = 0;
    std::uint32_t place = 0; ///< in the walk of the board's devices, from 1
    std::string name;
    ResourceKind kind = ResourceKind::Other;
    std::optional<int> type;
    std::optional<int> status;
    std::optional<int> moduleBoard;
    std::optional<int> number;
    std::optional<int> coderType; ///< voice, as the next three
    std::optional<int> channelState;
    std::optional<int> gain; ///< may be negative; -1 means unknown
    std::optional<int> echoCancellation;
    std::optional<int> lineNumber; ///< trunks of either kind, as the next three
    std::optional<int> lineType;
    std::optional<int> lineStatus;
    std::optional<int> protocolType;
    std::optional<int> bearerCount; ///< ISDN trunks, as the next one
    std::optional<int> signallingStatus;
    std::optional<int> timeSlotCount; ///< stations

    std::array<std::uint32_t, 2> index() const { return {boardIndex, place}; }
    bool operator==(ResourceRow const&) const = default;
};

} // namespace kvloamd
