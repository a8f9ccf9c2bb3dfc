// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/Log.h"

#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <climits>
#include <cstdint>
#include <mutex>

namespace kvloamd {

namespace {

constexpr std::string_view kPrefix = "kvloamd: ";

std::atomic<LogLevel> logLevel = LogLevel::Info;

std::mutex writing; ///< guards `lost`, and the time between poll() and write()
std::uint64_t lost = 0;

std::string lineOf(std::string_view text) {
    std::string line(kPrefix);
    // A pipe that poll() reports as writable takes so much without blocking.
    line += text.substr(0, PIPE_BUF - kPrefix.size() - 1);
    std::ranges::replace(line, '\n', ' ');
    line += '\n';
    return line;
}

/// Writes the line whole, without waiting; false when that fails.
bool writeLine(std::string const& line) {
    ssize_t written = send(STDERR_FILENO, line.data(), line.size(), MSG_DONTWAIT | MSG_NOSIGNAL);
    if (written < 0 && errno == ENOTSOCK) {
        pollfd writable{STDERR_FILENO, POLLOUT, 0};
        if (poll(&writable, 1, 0) <= 0 || (writable.revents & POLLOUT) == 0) return false;
        written = write(STDERR_FILENO, line.data(), line.size());
    }
    return written == static_cast<ssize_t>(line.size());
}

} // namespace

void setLogLevel(LogLevel level) {
    logLevel = level;
}

void log(LogLevel level, std::string_view text) {
    if (level > logLevel) return;
    std::scoped_lock const guard(writing);
    if (lost > 0 &&
        writeLine(lineOf("log lines lost, because the log took no more: " + std::to_string(lost))))
        lost = 0;
    if (lost > 0 || !writeLine(lineOf(text))) ++lost;
}

} // namespace kvloamd
