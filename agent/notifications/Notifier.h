// SPDX-License-Identifier: BSD-2-Clause
// Sends what the notification queue holds.
#pragma once

#include <chrono>
#include <optional>

#include "agent/notifications/NotificationQueue.h"
#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// Used on the thread that does all SNMP only.
class Notifier {
  public:
    /// How long a notification waits for a snapshot that shows its change. Whoever receives it and
    /// asks at once should see the change; whoever waits for a slow platform should hear of it all
    /// the same.
    static constexpr std::chrono::milliseconds kPatience{1000};

    /// `queue` and `sink` outlive the notifier.
    Notifier(NotificationQueue& queue, NotificationSink& sink) : m_queue(queue), m_sink(sink) {}

    /// Sends the notifications whose news a snapshot begun at `snapshotBegun` shows, and those that
    /// have waited long enough, as far as the sink is ready. One stays in the queue until the sink
    /// answers for it. Returns when to come again at the latest, if only time is missing.
    std::optional<Clock::time_point> announce(Clock::time_point snapshotBegun);

    /// Sends without waiting for a snapshot. Whether nothing is left.
    bool announceAll();

  private:
    void send(Notification const& notification);

    NotificationQueue& m_queue;
    NotificationSink& m_sink;
};

} // namespace kvloamd
