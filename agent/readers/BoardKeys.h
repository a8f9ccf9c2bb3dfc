// SPDX-License-Identifier: BSD-2-Clause
// Identifies boards wherever something is kept for them.
#pragma once

#include <string>
#include <vector>

#include "agent/rows/BoardRow.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

/// A `BoardKey` identifies a board from one run of the agent to the next.
struct BoardKey {
    std::string name;   ///< not empty, except for what belongs to no board
    bool stable = true; ///< false: good while the board is present; nothing may be kept for it

    bool operator==(BoardKey const&) const = default;
};

/// The keys of `boards`, all different: a board's serial number, if it is known. A board of unknown
/// serial number is identified by its place: its slot, or else its logical identifier. Of several
/// boards with one serial number, the one in the lowest place has it as its key, the others have
/// their places besides. A board that has neither gets a key that is not stable.
std::vector<BoardKey> boardKeys(Rows<BoardRow> const& boards);

/// A `KnownBoardKeys` finds the keys of all boards again only when something has changed that they
/// follow from. Unsynchronised.
class KnownBoardKeys {
  public:
    /// The keys of `boards`.
    std::vector<BoardKey> const& of(Rows<BoardRow> const& boards);
    /// Whether the last `of` gave the keys that the one before had given.
    bool areAsBefore() const { return m_areAsBefore; }

  private:
    Rows<BoardRow> m_boards; ///< whose keys these are
    std::vector<BoardKey> m_keys;
    bool m_areAsBefore = false;
};

/// "shelf 1 bus 2 slot 4", as far as the board knows; empty if it does not know its slot.
std::string slotName(BoardRow const& board);

} // namespace kvloamd
