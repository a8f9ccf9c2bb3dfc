// SPDX-License-Identifier: BSD-2-Clause
// Reads one board into a row.
#pragma once

#include <string>
#include <vector>

#include "agent/rows/BoardRow.h"
#include "board/Board.h"

namespace kvloamd {

/// Asks `board` every query. `boardIndex` is its index at the board manager, above 0.
BoardRow readBoard(Board& board, int boardIndex);

/// The serial number as `readBoard` gives it.
std::string readSerialNumber(Board& board);

/// What each of `boards` is known by wherever something is kept for it: its serial number; where
/// that is unknown, or a board's before it, the board index besides. None is empty.
std::vector<std::string> keptNames(std::vector<BoardRow> const& boards);

} // namespace kvloamd
