// SPDX-License-Identifier: BSD-2-Clause
// The states of boards and ports in the words of ENTITY-STATE-MIB.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <vector>

#include "agent/rows/BoardRow.h"
#include "agent/rows/EntityRows.h"
#include "agent/rows/FaultRow.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

/// The state of a board by its status, and by whether it has a fault.
EntityState boardState(BoardRow const& board, bool hasFault);

/// What the interface's status and the line's alarms (`line` is null for an Ethernet interface) say
/// of a port.
EntityState portState(InterfaceRow const& interface, LineRow const* line);

/// An `EntityStates` remembers since when every entity has been in its state. Unsynchronised.
class EntityStates {
  public:
    /// Seconds since the epoch.
    using Now = std::function<long()>;

    explicit EntityStates(Now now);

    /// The states of those `entities` that have one: modules, their processors and ports. What is
    /// found in the first reading has been as it is since the states were made. States that have
    /// not changed are shared with the reading before.
    Rows<EntityStateRow> read(Rows<PhysicalRow> const& entities, Rows<BoardRow> const& boards,
                              InterfaceRows const& interfaces, std::vector<FaultRow> const& faults);

  private:
    /// The rows that a state follows from. Null: there is no such row.
    struct Origin {
        PhysicalRow const* entity = nullptr;
        BoardRow const* board = nullptr;
        InterfaceRow const* interface = nullptr; ///< null if there is a board
        LineRow const* line = nullptr;
        std::size_t state = 0; ///< its place
    };

    Now m_now;
    std::string m_started; ///< when, as `dateOctets`
    bool m_read = false;
    Rows<EntityStateRow> m_former;
    std::vector<Origin> m_origins; ///< of all states, in their order
    // The rows that the states were derived from. They are kept so that no new row gets the address
    // of an old one.
    Rows<PhysicalRow> m_entities;
    Rows<BoardRow> m_boards;
    Rows<InterfaceRow> m_interfaces;
    Rows<LineRow> m_lines;
    std::vector<FaultRow> m_faults;
};

} // namespace kvloamd
