// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/Log.h"

#include <atomic>
#include <cstdio>

namespace kvloamd {

namespace {

std::atomic<LogLevel> logLevel = LogLevel::Info;

} // namespace

void setLogLevel(LogLevel level) {
    logLevel = level;
}

void log(LogLevel level, std::string_view text) {
    if (level > logLevel) return;
    std::string line = "kvloamd: ";
    line += text;
    line += '\n';
    std::fwrite(line.data(), 1, line.size(), stderr);
}

} // namespace kvloamd
