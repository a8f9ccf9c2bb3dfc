// SPDX-License-Identifier: BSD-2-Clause
// Reads one board into a row.
#pragma once

#include <string>

#include "agent/rows/BoardRow.h"
#include "board/Board.h"

namespace kvloamd {

/// Asks `board` every query. `boardIndex` is its index at the board manager, above 0.
BoardRow readBoard(Board& board, int boardIndex);

/// The serial number as `readBoard` gives it.
std::string readSerialNumber(Board& board);

} // namespace kvloamd
