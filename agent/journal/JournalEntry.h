// SPDX-License-Identifier: BSD-2-Clause
// What the journal records.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

#include "agent/alarms/Alarm.h"
#include "agent/rows/NotificationLogRows.h"

namespace kvloamd {

/// The numbers are on disk: they stay.
enum class JournalEvent : int {
    AgentStarted = 1,
    AgentStopped = 2,
    AlarmRaised = 3,
    AlarmCleared = 4,
    AlarmChanged = 5, ///< its severity
    BoardStatus = 6,
    Configuration = 7, ///< was read again
    Setting = 8,       ///< by SNMP
    Notification = 9   ///< was sent, or dropped
};

/// "alarmRaised" and so on; "event" for a number of a later version.
char const* journalEventName(JournalEvent event);

/// One entry. Its sequence number is given by the journal.
struct JournalEntry {
    JournalEvent event = JournalEvent::AgentStarted;
    std::chrono::system_clock::time_point date;
    std::string text; ///< one line, for people
    std::string board;
    std::uint32_t ifIndex = 0;
    std::optional<Alarm> alarm;                     ///< of the three events of alarms
    std::optional<LoggedNotification> notification; ///< of that event

    std::uint32_t sequence = 0; ///< set by the journal
};

} // namespace kvloamd
