// SPDX-License-Identifier: BSD-2-Clause
// The names and descriptions of interfaces.
#pragma once

#include <string>

#include "agent/rows/IndexKey.h"
#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// Gives an interface a name and a description if it has none: "eth1@A" and "Ethernet interface 1
/// of board A". `key`: what identifies it on its board. `board`: what to call the board.
void completeName(InterfaceRow& row, IndexKey const& key, std::string const& board);

/// `text` with `suffix`. If that is too long to be served, the text is cut, not the suffix.
std::string withSuffix(std::string const& text, std::string const& suffix);

} // namespace kvloamd
