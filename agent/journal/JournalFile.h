// SPDX-License-Identifier: BSD-2-Clause
// The journal's file.
#pragma once

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <vector>

#include "agent/journal/JournalEntry.h"
#include "agent/readers/Database.h"

namespace kvloamd {

/// How much the journal keeps. The older entries are deleted.
struct JournalLimits {
    std::size_t entries = 100000;
    std::chrono::hours age{24 * 90};
};

/// A `JournalFile` is an open SQLite file in WAL mode with the journal's entries and the alarms
/// that are active: whatever ends the process, every entry that was written is complete, and the
/// alarms are those that the entries say. All operations throw `DatabaseFault`. Unsynchronised.
class JournalFile {
  public:
    /// How many sequence numbers are reserved at a time. After an end of the process that left no
    /// time to write, the next one begins after the reserved numbers.
    static constexpr std::uint32_t kReserved = 32768;

    /// Opens the file, and creates it if it is missing. Throws `DatabaseDamaged` if it is no
    /// journal of this version.
    explicit JournalFile(std::string const& path, JournalLimits limits = {});

    /// The first sequence number that has never been given.
    std::uint32_t nextSequence();
    /// The number of the newest entry; 0: none.
    std::uint32_t newest();
    /// Writes entries, all or none. `next`: the sequence number of the next entry.
    void write(std::span<JournalEntry const> entries, std::uint32_t next);
    /// Replaces the active alarms, and gives back the numbers from `next` on.
    void close(std::vector<Alarm> const& active, std::uint32_t next);

    std::vector<Alarm> activeAlarms();
    /// The newest entries with notifications, the oldest first.
    std::vector<JournalEntry> notifications(std::size_t most);
    /// The newest entries, the oldest first; without their alarms and notifications.
    std::vector<JournalEntry> entries(std::size_t most);

  private:
    void reserve(std::uint32_t upTo);
    void insert(JournalEntry const& entry);
    void insertVariable(std::uint32_t sequence, int position, LoggedVariable const& variable);
    void keepAlarm(Alarm const& alarm);
    void dropAlarm(AlarmKey const& key);
    void prune(std::chrono::system_clock::time_point now);

    /// The statement, prepared when it is used for the first time.
    Statement& prepared(std::optional<Statement>& statement, char const* sql);

    Database m_database;
    std::optional<Statement> m_insert; ///< entries, as the next ones variables and alarms
    std::optional<Statement> m_insertVariable;
    std::optional<Statement> m_keepAlarm;
    std::optional<Statement> m_dropAlarm;
    JournalLimits m_limits;
    std::uint32_t m_reserved = 0;
    std::size_t m_unpruned = 0; ///< entries since the last pruning
};

} // namespace kvloamd
