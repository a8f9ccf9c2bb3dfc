// SPDX-License-Identifier: BSD-2-Clause
// The log on standard error: one line for each fact.
#pragma once

#include <string>
#include <string_view>

namespace kvloamd {

enum class LogLevel { Error, Warning, Info, Debug };

/// Suppresses lines above `level` from now on. The initial level is `Info`. Thread-safe.
void setLogLevel(LogLevel level);

/// Writes the line "kvloamd: <text>" with one write operation. Line breaks in `text` become spaces,
/// and a very long text is cut. Never waits: if the log takes no more, because nobody reads its
/// pipe or the disk is full, the line is lost. The first line that succeeds afterwards is preceded
/// by one with the number of lost lines. Thread-safe.
void log(LogLevel level, std::string_view text);

} // namespace kvloamd
