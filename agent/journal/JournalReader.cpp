// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/JournalReader.h"

#include <algorithm>
#include <limits>

#include "agent/journal/JournalEntry.h"
#include "agent/readers/Database.h"

namespace kvloamd {

namespace {

constexpr char kAfter[] =
    "SELECT sequence, date, event, text, board, ifindex, kind, severity, times FROM entry "
    "WHERE sequence > ? ORDER BY sequence LIMIT ?";
constexpr char kNewest[] =
    "SELECT * FROM (SELECT sequence, date, event, text, board, ifindex, kind, severity, times "
    "FROM entry WHERE sequence > ? ORDER BY sequence DESC LIMIT ?) ORDER BY sequence";

/// The name of the kind; empty for a kind of a later version.
std::string kindName(std::int64_t number) {
    for (AlarmKindInfo const& info : alarmKinds())
        if (static_cast<std::int64_t>(info.kind) == number) return info.name;
    return {};
}

JournalRow rowOf(Statement const& entry) {
    JournalRow row;
    row.number = static_cast<std::uint32_t>(entry.number(0));
    row.date = std::chrono::system_clock::time_point(std::chrono::milliseconds(entry.number(1)));
    row.event = journalEventName(static_cast<JournalEvent>(entry.number(2)));
    row.text = entry.text(3);
    row.board = entry.text(4);
    row.ifIndex = static_cast<std::uint32_t>(entry.number(5));
    row.alarm = kindName(entry.number(6));
    row.severity = static_cast<int>(entry.number(7));
    row.times = static_cast<std::uint32_t>(entry.number(8));
    return row;
}

} // namespace

char const* journalEventName(JournalEvent event) {
    switch (event) {
    case JournalEvent::AgentStarted:
        return "agentStarted";
    case JournalEvent::AgentStopped:
        return "agentStopped";
    case JournalEvent::AlarmRaised:
        return "alarmRaised";
    case JournalEvent::AlarmCleared:
        return "alarmCleared";
    case JournalEvent::AlarmChanged:
        return "alarmChanged";
    case JournalEvent::BoardStatus:
        return "boardStatus";
    case JournalEvent::Configuration:
        return "configuration";
    case JournalEvent::Setting:
        return "setting";
    case JournalEvent::Notification:
        return "notification";
    }
    return "event";
}

std::optional<JournalPage> readJournal(std::string const& path, std::optional<std::uint32_t> after,
                                       std::size_t limit, std::uint32_t newest) {
    JournalPage page;
    page.newest = newest;
    // A file that is missing would be created.
    if (path.empty() || newest == 0) return page;
    try {
        Database database(path);
        database.setPatience(std::chrono::milliseconds(1000));
        Statement entries(database, after ? kAfter : kNewest);
        constexpr std::size_t kMost = std::numeric_limits<std::int32_t>::max();
        entries.bind(1, std::int64_t{after.value_or(0)})
            .bind(2, static_cast<std::int64_t>(std::min(limit, kMost)));
        while (entries.step())
            page.rows.push_back(rowOf(entries));
    } catch (DatabaseFault const&) {
        return std::nullopt;
    }
    // More may have been written since `newest` was read.
    if (!page.rows.empty()) page.newest = std::max(page.newest, page.rows.back().number);
    return page;
}

} // namespace kvloamd
