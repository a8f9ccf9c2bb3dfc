// SPDX-License-Identifier: BSD-2-Clause
// Builds the physical entities: boards, their processors and their ports.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "agent/readers/BoardKeys.h"
#include "agent/readers/EntityStates.h"
#include "agent/readers/PerBoard.h"
#include "agent/readers/StableIndices.h"
#include "agent/readers/TableJoin.h"
#include "agent/rows/EntityRows.h"
#include "agent/rows/PlatformRecords.h"
#include "agent/rows/Rows.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

/// An `EntityReader` builds the tree of physical entities. There is one chassis. It contains a slot
/// for every board that knows its slot, the slot contains the board; other boards are in the
/// chassis. A board contains its processors and its ports.
///
/// It keeps the entities of every board, and builds them anew when something has changed that they
/// follow from. Unsynchronised.
class EntityReader {
  public:
    /// `indices` and `settings` outlive the reader. `started`: the agent's start. `now`: the time
    /// of day.
    EntityReader(StableIndices& indices, Settings const& settings, Clock::time_point started,
                 EntityStates::Now now);

    /// The entities of what is in `snapshot` already.
    EntityRows read(Snapshot const& snapshot);

  private:
    /// The entities of one board, or of none.
    struct Part {
        std::vector<PhysicalRow> entities; ///< all ascending
        std::vector<ContainsRow> contains;
        std::vector<AliasRow> aliases;

        bool operator==(Part const&) const = default;
    };
    /// What the entities of a board follow from.
    struct Origin {
        BoardKey key;
        BoardRow const* board = nullptr;
        std::vector<ProcessorRow> processors;
        std::vector<PortRow const*> ports;
        std::vector<InterfaceRow const*> interfaces; ///< of the ports; null: none
        std::uint32_t container = 0;
        bool isAloneThere = false; ///< no other board is in its slot

        bool operator==(Origin const&) const = default;
    };
    struct KnownBoard {
        Origin origin;
        std::shared_ptr<Part const> part; ///< null: not built yet
    };
    /// How a slot is taken.
    struct Slot {
        std::uint32_t entity = 0;
        int boards = 0;
    };

    bool isAsBefore(Snapshot const& snapshot) const;
    /// Updates the entities. Returns whether any has changed. `anew`: builds all of them again.
    bool build(Snapshot const& snapshot, bool anew);
    void findSlots(Rows<BoardRow> const& boards);
    void findPlace(Origin& origin) const;
    Part boardPart(Origin const& origin);
    static void sort(Part& part);
    void add(Part& part, PhysicalRow row) const;
    void applySettings(PhysicalRow& row) const;
    void join();

    StableIndices& m_indices;
    Settings const& m_settings;
    Uptime const m_uptime;
    EntityStates m_states;

    // What the last reading was made of. Rows that are kept do not lend their addresses to others.
    Rows<BoardRow> m_boardRows;
    Rows<PortRow> m_portRows;
    Rows<InterfaceRow> m_interfaceRows;
    std::shared_ptr<PlatformRecords const> m_records;
    std::vector<SettingEntry> m_set;

    KnownBoardKeys m_keys;
    std::map<std::uint32_t, std::vector<SettingEntry>> m_setOf; ///< by entity
    std::map<std::string, Slot> m_slots;
    std::uint32_t m_chassis = 0;
    bool m_known = false;                 ///< the indices are those of the file
    std::shared_ptr<Part const> m_places; ///< the chassis and its slots
    std::vector<std::pair<std::uint32_t, std::size_t>> m_ports; ///< board index and place
    PerBoard<KnownBoard> m_boards;
    PartExchanges<Part> m_exchanges;
    bool m_anew = true; ///< nothing of the reading before can be used
    std::shared_ptr<PhysicalEntities const> m_physical; ///< null before the first reading
    std::uint32_t m_lastChange = 0;
};

} // namespace kvloamd
