// SPDX-License-Identifier: BSD-2-Clause
// Reads the lines, channels and interfaces of one board.
#pragma once

#include <functional>
#include <vector>

#include "agent/readers/LineHistories.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/InterfaceRows.h"
#include "board/Board.h"
#include "board/DS1IntervalTable.h"
#include "board/DS1LineDevice.h"
#include "core/ReferenceCounter.h"

namespace kvloamd {

/// What tells at once that a line has changed, apart from its history.
struct LineCheck {
    int status = 0;
    int operStatus = 0;
    int adminStatus = 0;
    int trapEnable = 0;
    long lastChange = 0; ///< of the status: since the epoch; negative: not known

    bool operator==(LineCheck const&) const = default;
};

LineCheck checkLine(DS1LineDevice& line);

/// A line of a board, and what it answered before its row was read.
struct KnownLine {
    ReferenceCounter<DS1LineDevice> line;
    ReferenceCounter<DS1IntervalTable> history; ///< may be empty
    LineCheck check;
};

/// The rows of one board. In the place of every ifIndex is the interface's number on the board,
/// from 1 in the order of `keys`; the rows are in no order.
struct BoardInterfaces {
    std::vector<IndexKey> keys; ///< all different
    BoardInterfaceRows rows;
    std::vector<KnownLine> lines; ///< in the order of `rows.lines`
    bool hasOnlyLines = true;     ///< everything there is, is a line
};

/// Seconds since the epoch as hundredths of a second since the agent's start.
using ToTicks = std::function<std::uint32_t(long)>;

/// Asks the board's features for all that they hold: lines first, then channels, Ethernet
/// interfaces and IP interfaces.
BoardInterfaces readInterfaces(Board& board, ToTicks const& toTicks, LineHistories& histories);

} // namespace kvloamd
