// SPDX-License-Identifier: BSD-2-Clause
// The queue between the threads that report changes and the thread that sends notifications.
#pragma once

#include <cstddef>
#include <deque>
#include <mutex>
#include <optional>
#include <utility>

#include "agent/notifications/Notification.h"

namespace kvloamd {

/// A `NotificationQueue` is a bounded first-in, first-out queue. When it is full, new notifications
/// are dropped. It counts the notifications that wait, were sent, or were dropped. Thread-safe.
class NotificationQueue {
  public:
    static constexpr std::size_t kCapacity = 4096;

    /// `counters` outlives the queue.
    explicit NotificationQueue(Counters& counters, std::size_t capacity = kCapacity)
        : m_counters(counters), m_capacity(capacity) {}

    void push(Notification notification) {
        std::scoped_lock const guard(m_mutex);
        if (m_notifications.size() < m_capacity)
            m_notifications.push_back(std::move(notification));
        else
            ++m_counters.notificationsDropped;
        countWaiting();
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
        ++(delivery == Delivery::Sent ? m_counters.notificationsSent
                                      : m_counters.notificationsDropped);
        countWaiting();
        return notification;
    }

    std::size_t size() {
        std::scoped_lock const guard(m_mutex);
        return m_notifications.size();
    }

  private:
    void countWaiting() {
        m_counters.notificationsWaiting = static_cast<std::uint32_t>(m_notifications.size());
    }

    Counters& m_counters;
    std::size_t m_capacity;
    std::mutex m_mutex;
    std::deque<Notification> m_notifications;
};

} // namespace kvloamd
