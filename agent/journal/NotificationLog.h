// SPDX-License-Identifier: BSD-2-Clause
// The newest notifications of the journal, in memory.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <optional>
#include <vector>

#include "agent/journal/JournalEntry.h"
#include "agent/rows/Clock.h"
#include "agent/rows/NotificationLogRows.h"

namespace kvloamd {

/// A `NotificationLog` keeps the newest notifications of the journal in memory, so that requests
/// for them need not wait for the disk. When it is full, the oldest is removed. Thread-safe.
class NotificationLog {
  public:
    static constexpr std::size_t kCapacity = 1000;

    /// `age`: after which notifications are removed.
    explicit NotificationLog(std::chrono::hours age, std::size_t capacity = kCapacity)
        : m_age(age), m_capacity(capacity) {}

    /// Enters what the journal has of earlier runs: entries with notifications. Before `add`.
    void load(std::vector<JournalEntry> entries);
    /// Enters an entry with a notification that was written `now`.
    void add(JournalEntry entry, Clock::time_point now);

    /// The rows at the time `date`; the same ones until the log changes. `started`: the agent's
    /// start.
    std::shared_ptr<NotificationLogRows const> rows(Clock::time_point started,
                                                    std::chrono::system_clock::time_point date);

  private:
    struct Kept {
        JournalEntry entry;
        std::optional<Clock::time_point> when; ///< nothing: in an earlier run
    };

    void removeOld(std::chrono::system_clock::time_point date);

    std::chrono::hours const m_age;
    std::size_t const m_capacity;
    std::mutex m_mutex; ///< guards what follows
    std::deque<Kept> m_kept;
    NotificationLogRow m_counts;
    std::shared_ptr<NotificationLogRows const> m_rows; ///< null: to be made
};

} // namespace kvloamd
