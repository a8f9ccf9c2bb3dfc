// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/Log.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <atomic>
#include <cerrno>
#include <climits>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <mutex>

namespace kvloamd {

namespace {

constexpr std::string_view kPrefix = "kvloamd: ";

std::atomic<LogLevel> logLevel = LogLevel::Info;

std::mutex writing; ///< guards `lost`, and the time between poll() and write()
std::uint64_t lost = 0;
int journal = -1; ///< a socket that is connected to the journal's; -1: none

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

std::string withoutBreaks(std::string_view text) {
    std::string line(text);
    std::ranges::replace(line, '\n', ' ');
    return line;
}

int priorityOf(LogLevel level) {
    constexpr int kPriorities[] = {3, 4, 6, 7}; // as syslog(3) numbers them
    return kPriorities[static_cast<int>(level)];
}

enum class Sent { Yes, Full, NobodyListens };

/// Sends an entry to the journal without waiting, in the journal's own protocol: the library's
/// function for this would wait while the journal is full.
Sent sendEntry(LogLevel level, std::string_view text, std::initializer_list<LogField> fields) {
    std::string entry =
        "PRIORITY=" + std::to_string(priorityOf(level)) +
        "\nSYSLOG_IDENTIFIER=kvloamd\nMESSAGE=" + withoutBreaks(text.substr(0, PIPE_BUF)) + '\n';
    for (LogField const& field : fields)
        if (!field.value.empty())
            entry += std::string(field.name) + '=' + withoutBreaks(field.value) + '\n';
    if (send(journal, entry.data(), entry.size(), MSG_DONTWAIT | MSG_NOSIGNAL) >= 0)
        return Sent::Yes;
    return errno == EAGAIN || errno == ENOBUFS ? Sent::Full : Sent::NobodyListens;
}

/// False when the line is lost.
bool writeEntry(LogLevel level, std::string_view text,
                std::initializer_list<LogField> fields = {}) {
    if (journal >= 0)
        if (Sent const sent = sendEntry(level, text, fields); sent != Sent::NobodyListens)
            return sent == Sent::Yes;
    return writeLine(lineOf(text));
}

} // namespace

void setLogLevel(LogLevel level) {
    logLevel = level;
}

void log(LogLevel level, std::string_view text, std::initializer_list<LogField> fields) {
    if (level > logLevel) return;
    std::scoped_lock const guard(writing);
    if (lost > 0 && writeEntry(LogLevel::Warning, "log lines lost, because the log took no more: " +
                                                      std::to_string(lost)))
        lost = 0;
    if (lost > 0 || !writeEntry(level, text, fields)) ++lost;
}

bool standardErrorIsJournal() {
    char const* const stream = std::getenv("JOURNAL_STREAM");
    struct stat status {};
    if (stream == nullptr || fstat(STDERR_FILENO, &status) != 0) return false;
    return stream == std::to_string(status.st_dev) + ':' + std::to_string(status.st_ino);
}

void logToJournal(std::string const& path) {
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path) return;
    std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
    int const descriptor = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (descriptor < 0) return;
    if (connect(descriptor, reinterpret_cast<sockaddr const*>(&address), sizeof address) != 0) {
        close(descriptor);
        return;
    }
    std::scoped_lock const guard(writing);
    if (journal >= 0) close(journal);
    journal = descriptor;
}

} // namespace kvloamd
