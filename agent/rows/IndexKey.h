// SPDX-License-Identifier: BSD-2-Clause
// What identifies a thing that has an index, among those of its board.
#pragma once

#include <compare>
#include <string>

namespace kvloamd {

/// What has an index: interfaces, and physical entities in a file of their own. The numbers are in
/// the files: they stay.
enum class IndexKind : int {
    Line = 1,
    BearerChannel = 2,
    SignallingChannel = 3,
    Ethernet = 4,
    Ip = 5,
    Other = 6,
    Chassis = 7,
    Slot = 8,
    Board = 9,
    Processor = 10,
    Lapd = 11 ///< the data link of a signalling channel
};

/// One thing among those of its board, or among those of no board.
struct IndexKey {
    IndexKind kind = IndexKind::Other;
    std::string name;

    auto operator<=>(IndexKey const&) const = default;
};

} // namespace kvloamd
