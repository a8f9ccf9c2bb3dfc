// SPDX-License-Identifier: BSD-2-Clause
// The names and descriptions of interfaces.
#pragma once

#include <cstdint>
#include <string>
#include <unordered_map>
#include <vector>

#include "agent/rows/IndexKey.h"
#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// Gives an interface a name and a description if it has none: "eth1@A" and "Ethernet interface 1
/// of board A". `key`: what identifies it on its board. `board`: what to call the board.
void completeName(InterfaceRow& row, IndexKey const& key, std::string const& board);

/// What an interface is called.
struct InterfaceTexts {
    std::uint32_t ifIndex = 0;
    std::uint32_t boardIndex = 0;
    std::string name;
    std::string description;

    bool operator==(InterfaceTexts const&) const = default;
};

/// Makes the names different from each other, and the descriptions as well. While interfaces of
/// several boards have the same name, "@" and the board follow each; interfaces of one board that
/// still have the same name are told apart by their ifIndex. `boards`: what to call a board, by its
/// index.
void distinguishNames(std::vector<InterfaceTexts>& interfaces,
                      std::unordered_map<std::uint32_t, std::string> const& boards);

} // namespace kvloamd
