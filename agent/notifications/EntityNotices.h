// SPDX-License-Identifier: BSD-2-Clause
// Queues the notifications of ENTITY-MIB and ENTITY-STATE-MIB.
#pragma once

#include <chrono>
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
/// Thread-bound: the SNMP thread.
class EntityNotices {
  public:
    /// The shortest time between two entConfigChange notifications.
    static constexpr std::chrono::seconds kPause{5};

    /// `queue` outlives the notices.
    explicit EntityNotices(NotificationQueue& queue) : m_queue(queue) {}

    /// Queues the changes from the snapshot of the previous call to `newest`. The first call queues
    /// nothing. Returns the time of the next call if an entConfigChange waits for the end of the
    /// pause.
    std::optional<Clock::time_point> update(std::shared_ptr<Snapshot const> newest,
                                            Clock::time_point now);

  private:
    void queueStateChanges(Snapshot const& former, Snapshot const& newest);

    NotificationQueue& m_queue;
    std::shared_ptr<Snapshot const> m_former;
    bool m_changed = false;                              ///< since the last entConfigChange
    std::optional<Clock::time_point> m_lastConfigChange; ///< when it was queued
};

} // namespace kvloamd
