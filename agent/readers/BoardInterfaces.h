// SPDX-License-Identifier: BSD-2-Clause
// Reads the lines, channels and interfaces of one board.
#pragma once

#include <functional>
#include <optional>
#include <vector>

#include "agent/readers/LineHistories.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/InterfaceRows.h"
#include "board/Board.h"
#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"

namespace kvloamd {

/// The rows of one board. In the place of every ifIndex is the interface's number on the board,
/// from 1 in the order of `keys`; the rows are in no order.
struct BoardInterfaces {
    std::vector<IndexKey> keys; ///< all different
    InterfaceRows rows;
    // In the order of `rows.lines`.
    std::vector<ReferenceCounter<DS1LineDevice>> lines;
    std::vector<std::optional<long>> lineChanges; ///< when their status changed: since the epoch
};

/// Seconds since the epoch as hundredths of a second since the agent's start.
using ToTicks = std::function<std::uint32_t(long)>;

/// Asks the board's features for all that they hold: lines first, then channels, Ethernet
/// interfaces and IP interfaces.
BoardInterfaces readInterfaces(Board& board, ToTicks const& toTicks, LineHistories& histories);

} // namespace kvloamd
