// SPDX-License-Identifier: BSD-2-Clause
// Status changes on their way from the threads that tell of them to the one that announces them.
#pragma once

#include <cstddef>
#include <deque>
#include <mutex>
#include <optional>
#include <string>

#include "agent/Snapshot.h"

namespace kvloamd {

struct StatusChange {
    int boardIndex = 0;
    std::string serialNumber;
    int status = 0;
    Clock::time_point when;
};

/// First in, first out, bounded: a change that finds the queue full is dropped and counted. All
/// operations may be called from any thread.
class StatusQueue {
  public:
    static constexpr std::size_t kCapacity = 4096;

    /// `counters` outlives the queue.
    explicit StatusQueue(Counters& counters, std::size_t capacity = kCapacity)
        : m_counters(counters), m_capacity(capacity) {}

    void push(StatusChange change) {
        ++m_counters.statusChanges;
        std::scoped_lock const guard(m_mutex);
        if (m_changes.size() < m_capacity)
            m_changes.push_back(std::move(change));
        else
            ++m_counters.notificationsDropped;
    }

    /// The oldest change, which stays; nothing when the queue is empty.
    std::optional<StatusChange> oldest() {
        std::scoped_lock const guard(m_mutex);
        if (m_changes.empty()) return std::nullopt;
        return m_changes.front();
    }

    /// Takes the oldest change out; nothing when the queue is empty. There is one consumer only.
    std::optional<StatusChange> pop() {
        std::scoped_lock const guard(m_mutex);
        if (m_changes.empty()) return std::nullopt;
        StatusChange change = std::move(m_changes.front());
        m_changes.pop_front();
        return change;
    }

    std::size_t size() {
        std::scoped_lock const guard(m_mutex);
        return m_changes.size();
    }

  private:
    Counters& m_counters;
    std::size_t m_capacity;
    std::mutex m_mutex;
    std::deque<StatusChange> m_changes;
};

} // namespace kvloamd
