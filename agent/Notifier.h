// SPDX-License-Identifier: BSD-2-Clause
// Announces status changes as notifications.
#pragma once

#include <chrono>
#include <optional>

#include "agent/NotificationSink.h"
#include "agent/StatusQueue.h"

namespace kvloamd {

/// Used on the thread that does all SNMP only.
class Notifier {
  public:
    /// How long a notification waits for a snapshot that shows its change. Whoever receives it and
    /// asks at once should see the change; whoever waits for a slow platform should hear of it all
    /// the same.
    static constexpr std::chrono::milliseconds kPatience{1000};

    /// `queue` and `sink` outlive the notifier. `enterprise` is the arc above all names.
    Notifier(StatusQueue& queue, NotificationSink& sink, Oid enterprise);

    /// Announces the changes that a snapshot begun at `snapshotBegun` shows, and those that have
    /// waited long enough, as far as the sink is ready. A change stays in the queue until the sink
    /// answers for it. Returns when to come again at the latest, if only time is missing.
    std::optional<Clock::time_point> announce(Clock::time_point snapshotBegun);

    /// Announces without waiting for a snapshot. Whether nothing is left.
    bool announceAll();

  private:
    Notification notificationOf(StatusChange const& change) const;
    void send(StatusChange const& change);

    StatusQueue& m_queue;
    NotificationSink& m_sink;
    Oid m_enterprise;
};

} // namespace kvloamd
