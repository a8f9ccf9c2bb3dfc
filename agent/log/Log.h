// SPDX-License-Identifier: BSD-2-Clause
// The log on standard error, or in the system's journal: one line for each fact.
#pragma once

#include <initializer_list>
#include <string>
#include <string_view>

namespace kvloamd {

enum class LogLevel { Error, Warning, Info, Debug };

/// What a line is about, for programs that search the journal: {"KVL_BOARD", "NX50001"}.
struct LogField {
    char const* name; ///< upper-case letters, digits and '_'
    std::string value;
};

/// Suppresses lines above `level` from now on. The initial level is `Info`. Thread-safe.
void setLogLevel(LogLevel level);

/// Writes the line "kvloamd: <text>" with one write operation. Line breaks in `text` become spaces,
/// and a very long text is cut. `fields` appear in the journal only; one without a value is left
/// out. Never waits: if the log takes no more, because nobody reads its pipe or the disk is full,
/// the line is lost. The first line that succeeds afterwards is preceded by one with the number of
/// lost lines. Thread-safe.
void log(LogLevel level, std::string_view text, std::initializer_list<LogField> fields = {});

/// Whether standard error is connected to the journal, as it is for a service of systemd.
bool standardErrorIsJournal();

/// From now on sends lines, with their level and fields, to the journal's socket at `path` instead
/// of standard error. Lines that cannot be sent there because nobody listens go to standard error.
/// Before other threads log.
void logToJournal(std::string const& path = "/run/systemd/journal/socket");

} // namespace kvloamd
