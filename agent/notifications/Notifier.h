// SPDX-License-Identifier: BSD-2-Clause
// Sends the notifications in the queue.
#pragma once

#include <chrono>
#include <cstddef>
#include <functional>
#include <optional>
#include <utility>

#include "agent/notifications/NotificationQueue.h"
#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// A `Notifier` moves notifications from the queue to a sink. Thread-bound: the SNMP thread.
class Notifier {
  public:
    /// How long a notification waits for a snapshot that shows its change. A manager that polls as
    /// soon as it receives the notification then sees the change. A slow platform must not delay
    /// the notification longer than this.
    static constexpr std::chrono::milliseconds kPatience{1000};

    /// How many notifications one call sends at most. What follows waits for the next call, so that
    /// requests are answered in between.
    static constexpr std::size_t kBatch = 32;

    /// Completes a notification that is about to be sent for the first time, and records it.
    using Complete = std::function<void(Notification&)>;

    /// `queue` and `sink` outlive the notifier. `complete` is called on the calling thread.
    Notifier(NotificationQueue& queue, NotificationSink& sink, Complete complete)
        : m_queue(queue), m_sink(sink), m_complete(std::move(complete)) {}

    /// Sends, while the sink is ready, the notifications whose change a snapshot that was begun at
    /// `snapshotBegun` shows, and those that have waited for `kPatience`. A notification stays in
    /// the queue until the sink has delivered it. Returns the time of the next call if a
    /// notification only waits for time to pass, or for the next batch.
    std::optional<Clock::time_point> send(Clock::time_point snapshotBegun);

    /// Sends without waiting for a snapshot or for the next batch. Returns whether the queue is
    /// empty.
    bool sendAll();

  private:
    void handOver(Notification&& notification);

    NotificationQueue& m_queue;
    NotificationSink& m_sink;
    Complete m_complete;
    std::optional<Notification> m_current; ///< completed, and perhaps to be sent again
};

} // namespace kvloamd
