// SPDX-License-Identifier: BSD-2-Clause
// Builds the physical entities: boards, their processors and their ports.
#pragma once

#include <cstdint>
#include <memory>

#include "agent/readers/EntityStates.h"
#include "agent/readers/StableIndices.h"
#include "agent/rows/EntityRows.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

/// An `EntityReader` builds the tree of physical entities. There is one chassis. It contains a slot
/// for every board that knows its slot, the slot contains the board; other boards are in the
/// chassis. A board contains its processors and its ports.
///
/// Unsynchronised.
class EntityReader {
  public:
    /// `indices` and `settings` outlive the reader. `started`: the agent's start. `now`: the time
    /// of day.
    EntityReader(StableIndices& indices, Settings const& settings, Clock::time_point started,
                 EntityStates::Now now);

    /// The entities of what is in `snapshot` already.
    EntityRows read(Snapshot const& snapshot);

  private:
    StableIndices& m_indices;
    Settings const& m_settings;
    Uptime const m_uptime;
    EntityStates m_states;
    std::shared_ptr<PhysicalEntities const> m_physical; ///< null before the first reading
    std::uint32_t m_lastChange = 0;
};

} // namespace kvloamd
