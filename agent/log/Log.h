// SPDX-License-Identifier: BSD-2-Clause
// Log lines on standard error: one line a fact.
#pragma once

#include <string>
#include <string_view>

namespace kvloamd {

enum class LogLevel { Error, Warning, Info, Debug };

/// Lines above `level` are left out from now on. The level is `Info` until it is set. Any thread.
void setLogLevel(LogLevel level);

/// Writes "kvloamd: <text>" as one line, in one piece. Any thread.
void log(LogLevel level, std::string_view text);

} // namespace kvloamd
