// SPDX-License-Identifier: BSD-2-Clause
// Reads the resource devices of boards.
#pragma once

#include <vector>

#include "agent/rows/BoardRow.h"
#include "agent/rows/ResourceRow.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// The resources of `boards`, which are ascending by index; the rows are, too. Thread-safe.
std::vector<ResourceRow> readResources(BoardManager& manager, std::vector<BoardRow> const& boards);

} // namespace kvloamd
