// SPDX-License-Identifier: BSD-2-Clause
// The queue between the threads that report changes and the thread that sends notifications.
#pragma once

#include <cstddef>
#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <utility>

#include "agent/notifications/Notification.h"

namespace kvloamd {

/// A `NotificationQueue` is a bounded first-in, first-out queue. When it is full, new notifications
/// are dropped. It counts the notifications that wait, and what became of the others. Thread-safe.
class NotificationQueue {
  public:
    static constexpr std::size_t kCapacity = 4096;

    /// `counters` outlives the queue.
    explicit NotificationQueue(Counters& counters, std::size_t capacity = kCapacity)
        : m_counters(counters), m_capacity(capacity) {}

    using Observer = std::function<void(Notification const&)>;
    /// Calls `dropped` with every notification that finds the queue full, on the thread that pushes
    /// it. Before the first one is pushed.
    void observeDrops(Observer dropped) { m_dropped = std::move(dropped); }

    void push(Notification notification) {
        {
            std::scoped_lock const guard(m_mutex);
            if (m_notifications.size() < m_capacity) {
                m_notifications.push_back(std::move(notification));
                countWaiting();
                return;
            }
            ++m_counters.notificationsDropped;
        }
        if (m_dropped) m_dropped(notification);
    }

    /// The oldest notification, which stays in the queue; nothing when the queue is empty.
    std::optional<Notification> oldest() {
        std::scoped_lock const guard(m_mutex);
        if (m_notifications.empty()) return std::nullopt;
        return m_notifications.front();
    }

    /// Removes the oldest notification and counts it as `delivery` says; nothing when the queue is
    /// empty. Requires that only one thread consumes.
    std::optional<Notification> pop(Delivery delivery = Delivery::Sent) {
        std::scoped_lock const guard(m_mutex);
        if (m_notifications.empty()) return std::nullopt;
        Notification notification = std::move(m_notifications.front());
        m_notifications.pop_front();
        count(delivery);
        countWaiting();
        return notification;
    }

    /// Counts what became of a notification that was awaited when it left the queue.
    void settle(Delivery delivery) { count(delivery); }

    std::size_t size() {
        std::scoped_lock const guard(m_mutex);
        return m_notifications.size();
    }

  private:
    void count(Delivery delivery) {
        switch (delivery) {
        case Delivery::Sent:
        case Delivery::Acknowledged:
            ++m_counters.notificationsSent;
            break;
        case Delivery::Dropped:
            ++m_counters.notificationsDropped;
            break;
        case Delivery::Unacknowledged:
            ++m_counters.notificationsUnacknowledged;
            break;
        case Delivery::Awaited:
            break;
        }
    }
    void countWaiting() {
        m_counters.notificationsWaiting = static_cast<std::uint32_t>(m_notifications.size());
    }

    Counters& m_counters;
    std::size_t m_capacity;
    Observer m_dropped; ///< may be empty
    std::mutex m_mutex;
    std::deque<Notification> m_notifications;
};

} // namespace kvloamd
