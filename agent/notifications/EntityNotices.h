// SPDX-License-Identifier: BSD-2-Clause
// Queues the notifications of ENTITY-MIB and ENTITY-STATE-MIB.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <optional>

#include "agent/notifications/NotificationQueue.h"

namespace kvloamd {

/// An `EntityNotices` object compares each snapshot with the one before and queues
///
/// - entConfigChange when entities were added, removed or changed: the first one at once, then at
///   most one in each `kPause`, which covers all changes of that time;
/// - entStateOperEnabled and entStateOperDisabled when the operational state of an entity becomes
///   enabled or disabled. An entity that appears or disappears has not changed its state.
///
/// When many entities change at once, one call queues at most `kBatch` notifications, so that those
/// are sent, and requests answered, before the others are queued. Thread-bound: the SNMP thread.
class EntityNotices {
  public:
    /// The shortest time between two entConfigChange notifications.
    static constexpr std::chrono::seconds kPause{5};

    /// How many changes of states one call queues at most.
    static constexpr std::size_t kBatch = 32;

    /// `queue` outlives the notices.
    explicit EntityNotices(NotificationQueue& queue) : m_queue(queue) {}

    /// Queues the changes from the snapshot of the previous call to `newest`. The first call queues
    /// nothing. Returns the time of the next call if an entConfigChange waits for the end of the
    /// pause, or changes of states for the next batch.
    std::optional<Clock::time_point> update(std::shared_ptr<Snapshot const> newest,
                                            Clock::time_point now);
    /// Queues all changes of states that wait for the next batch: there is no next call.
    void finish();

  private:
    /// The state of an entity, whose change is to be queued.
    struct StateChange {
        std::uint32_t entity = 0;
        EntityState state;
        Clock::time_point when; ///< the beginning of the snapshot that showed it
    };

    void findStateChanges(Snapshot const& former, Snapshot const& newest);
    void queueStateChanges(std::size_t most);

    NotificationQueue& m_queue;
    std::shared_ptr<Snapshot const> m_former;
    std::deque<StateChange> m_stateChanges;              ///< not queued yet, in their order
    bool m_changed = false;                              ///< since the last entConfigChange
    std::optional<Clock::time_point> m_lastConfigChange; ///< when it was queued
};

} // namespace kvloamd
