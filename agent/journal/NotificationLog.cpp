// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/NotificationLog.h"

#include <algorithm>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

void NotificationLog::load(std::vector<JournalEntry> entries) {
    std::scoped_lock const guard(m_mutex);
    for (JournalEntry& entry : entries)
        if (entry.notification) m_kept.push_back({std::move(entry), std::nullopt});
    while (m_kept.size() > m_capacity)
        m_kept.pop_front();
    m_rows.reset();
}

void NotificationLog::add(JournalEntry entry, Clock::time_point now) {
    if (!entry.notification) return;
    std::scoped_lock const guard(m_mutex);
    m_kept.push_back({std::move(entry), now});
    ++m_counts.logged;
    if (m_kept.size() > m_capacity) {
        m_kept.pop_front();
        ++m_counts.bumped;
    }
    m_rows.reset();
}

void NotificationLog::removeOld(std::chrono::system_clock::time_point date) {
    if (std::erase_if(m_kept, [&](Kept const& kept) { return kept.entry.date < date - m_age; }) > 0)
        m_rows.reset();
}

std::shared_ptr<NotificationLogRows const>
NotificationLog::rows(Clock::time_point started, std::chrono::system_clock::time_point date) {
    std::scoped_lock const guard(m_mutex);
    removeOld(date);
    if (m_rows) return m_rows;
    // Threads enter their entries in another order than that of the numbers, if at the same time.
    std::ranges::sort(m_kept, {}, [](Kept const& kept) { return kept.entry.sequence; });
    auto rows = std::make_shared<NotificationLogRows>();
    Uptime const uptime(started);
    for (Kept const& kept : m_kept) {
        JournalEntry const& entry = kept.entry;
        rows->notifications.push_back(
            {entry.sequence, kept.when ? uptime.at(*kept.when) : 0,
             dateOctets(static_cast<long>(std::chrono::system_clock::to_time_t(entry.date))),
             entry.notification->name});
        std::uint32_t variable = 0;
        for (LoggedVariable const& logged : entry.notification->variables)
            rows->variables.push_back({entry.sequence, ++variable, logged});
    }
    rows->logs.front() = m_counts;
    rows->limit = static_cast<std::uint32_t>(m_capacity);
    rows->age = static_cast<std::uint32_t>(std::chrono::minutes(m_age).count());
    m_rows = std::move(rows);
    return m_rows;
}

} // namespace kvloamd
