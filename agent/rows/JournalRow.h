// SPDX-License-Identifier: BSD-2-Clause
// Entries of the event journal, as the agent shows them.
#pragma once

#include <chrono>
#include <cstdint>
#include <string>
#include <vector>

namespace kvloamd {

/// An entry of the journal.
struct JournalRow {
    std::uint32_t number = 0; ///< its sequence number
    std::chrono::system_clock::time_point date;
    std::string event;         ///< what kind of event: "alarmRaised", "boardStatus" and so on
    std::string text;          ///< one line, for people
    std::string board;         ///< the serial number of its board; empty: none
    std::uint32_t ifIndex = 0; ///< of its line, channel or interface; 0: none
    std::string alarm;         ///< the kind of its alarm; empty: none
    int severity = 0;          ///< of its alarm, as `AlarmRow::severity`; 0: none
    std::uint32_t times = 0;   ///< how often the alarm's condition had begun

    bool operator==(JournalRow const&) const = default;
};

/// A part of the journal.
struct JournalPage {
    std::vector<JournalRow> rows; ///< ascending by number
    std::uint32_t newest = 0;     ///< the number of the newest entry there is; 0: none

    bool operator==(JournalPage const&) const = default;
};

} // namespace kvloamd
