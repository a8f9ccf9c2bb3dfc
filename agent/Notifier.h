// SPDX-License-Identifier: BSD-2-Clause
// Announces status changes as SNMP notifications.
#pragma once

#include <chrono>
#include <optional>

#include "agent/StatusQueue.h"

namespace kvloamd {

/// Used on the thread that does all SNMP only.
class Notifier {
  public:
    /// How long a notification waits for a snapshot that shows its change. Whoever receives it and
    /// asks at once should see the change; whoever waits for a slow platform should hear of it all
    /// the same.
    static constexpr std::chrono::milliseconds kPatience{1000};

    /// `queue` outlives the notifier. `enterprise` is the arc above all names.
    Notifier(StatusQueue& queue, Oid enterprise);

    /// Announces that the agent has started.
    static void announceStart();

    /// Announces the changes that a snapshot begun at `snapshotBegun` shows, and those that have
    /// waited long enough. Returns when to come again at the latest, if any is left.
    std::optional<Clock::time_point> announce(Clock::time_point snapshotBegun);

    /// Announces all that is left.
    void announceAll();

  private:
    void send(StatusChange const& change) const;

    StatusQueue& m_queue;
    Oid m_enterprise;
};

} // namespace kvloamd
