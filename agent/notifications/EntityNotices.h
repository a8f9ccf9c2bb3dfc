// SPDX-License-Identifier: BSD-2-Clause
// Tells how the physical entities change from one snapshot to the next.
#pragma once

#include <chrono>
#include <memory>
#include <optional>

#include "agent/notifications/NotificationQueue.h"

namespace kvloamd {

/// entConfigChange when entities have come, gone or changed: at once, and then once at most in a
/// pause, at whose end all that changed meanwhile is one notification. entStateOperEnabled and
/// entStateOperDisabled when an entity has become so; one that comes, or goes, has not.
///
/// Used on one thread.
class EntityNotices {
  public:
    /// Between two entConfigChange, at least.
    static constexpr std::chrono::seconds kPause{5};

    /// `queue` outlives the notices.
    explicit EntityNotices(NotificationQueue& queue) : m_queue(queue) {}

    /// Queues what `newest` has that the snapshot of the call before had not; nothing for the first
    /// one. Returns when to come again at the latest, should something wait for the pause's end.
    std::optional<Clock::time_point> tell(std::shared_ptr<Snapshot const> newest,
                                          Clock::time_point now);

  private:
    void tellStates(Snapshot const& former, Snapshot const& newest);

    NotificationQueue& m_queue;
    std::shared_ptr<Snapshot const> m_former;
    bool m_changed = false; ///< since the last entConfigChange
    std::optional<Clock::time_point> m_lastChangeTold;
};

} // namespace kvloamd
