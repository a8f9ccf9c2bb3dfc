// SPDX-License-Identifier: BSD-2-Clause
#include "agent/journal/Journal.h"

#include <algorithm>
#include <ctime>
#include <exception>
#include <filesystem>
#include <iterator>
#include <system_error>
#include <utility>

#include "agent/journal/JournalReader.h"
#include "agent/journal/NotificationLog.h"
#include "agent/log/Log.h"

namespace kvloamd {

namespace {

/// A number above all that a journal has given whose last number is not known: the seconds since
/// the beginning of 2026. No journal gets more than one entry a second for years.
std::uint32_t numberByTime() {
    constexpr std::int64_t kBegin = 1767225600;
    return static_cast<std::uint32_t>(std::max<std::int64_t>(std::time(nullptr) - kBegin, 1));
}

} // namespace

Journal::Journal(std::string path, JournalLimits limits, std::size_t queue,
                 std::chrono::milliseconds retry)
    : m_path(std::move(path)), m_limits(limits), m_capacity(queue), m_retry(retry) {
    if (m_path.empty()) {
        m_closed = true;
        return;
    }
    try {
        open();
    } catch (DatabaseFault const& error) {
        m_next = numberByTime();
        noteFailure(error.what());
    }
    m_thread = std::thread([this] { run(); });
}

Journal::~Journal() {
    bool closed = false;
    {
        std::scoped_lock const guard(m_mutex);
        closed = m_closed;
        m_stop = true;
    }
    m_wake.notify_one();
    if (!closed) m_thread.join();
}

void Journal::open() {
    try {
        m_file = std::make_unique<JournalFile>(m_path, m_limits);
    } catch (DatabaseDamaged const& error) {
        setAside(error.what());
        m_file = std::make_unique<JournalFile>(m_path, m_limits);
        m_next = std::max(m_next, numberByTime());
    }
    m_former = m_file->activeAlarms();
    m_formerNotifications = m_file->notifications(NotificationLog::kCapacity);
    m_next = std::max(m_next, m_file->nextSequence());
    m_newest = m_file->newest();
    // Before a number is given.
    m_file->write({}, m_next);
}

std::uint32_t Journal::append(JournalEntry entry) {
    std::scoped_lock const guard(m_mutex);
    entry.sequence = m_counts.last = m_next++;
    if (m_closed) return entry.sequence;
    std::uint32_t const sequence = entry.sequence;
    if (m_queue.size() < m_capacity)
        m_queue.push_back(std::move(entry));
    else
        ++m_counts.lost;
    m_wake.notify_one();
    return sequence;
}

void Journal::close(std::vector<Alarm> const& active) {
    {
        std::scoped_lock const guard(m_mutex);
        if (m_closed) return;
        m_stop = true;
    }
    m_wake.notify_one();
    m_thread.join();
    std::scoped_lock const guard(m_mutex);
    m_closed = true;
    if (!m_queue.empty()) {
        m_counts.lost += static_cast<std::uint32_t>(m_queue.size());
        log(LogLevel::Warning, m_path + ": entries of the journal that are lost at the stop: " +
                                   std::to_string(m_queue.size()));
        m_queue.clear();
        return;
    }
    try {
        if (m_file) m_file->close(active, m_next);
    } catch (DatabaseFault const& error) {
        log(LogLevel::Warning, m_path + ": " + error.what());
    }
    m_file.reset();
}

void Journal::flush() const {
    std::unique_lock lock(m_mutex);
    m_idle.wait(lock,
                [this] { return m_closed || m_counts.failing || (m_queue.empty() && !m_writing); });
}

Journal::Counts Journal::counts() const {
    std::scoped_lock const guard(m_mutex);
    return m_counts;
}

std::optional<JournalPage> Journal::entriesAfter(std::uint32_t number, std::size_t limit) const {
    return readJournal(m_path, number, limit, newest());
}

std::optional<JournalPage> Journal::newestEntries(std::size_t limit) const {
    return readJournal(m_path, std::nullopt, limit, newest());
}

void Journal::run() {
    std::unique_lock lock(m_mutex);
    for (;;) {
        m_wake.wait(lock, [this] { return m_stop || !m_queue.empty(); });
        if (m_queue.empty()) return;
        std::vector<JournalEntry> batch(std::make_move_iterator(m_queue.begin()),
                                        std::make_move_iterator(m_queue.end()));
        m_queue.clear();
        std::uint32_t const next = m_next;
        m_writing = true;
        lock.unlock();
        bool const written = tryToWrite(batch, next);
        lock.lock();
        m_writing = false;
        if (written) {
            m_newest = batch.back().sequence;
            noteSuccess(batch.size());
            m_idle.notify_all();
            continue;
        }
        // The older entries come first; the newest that find no room any more are lost.
        while (batch.size() + m_queue.size() > m_capacity && !m_queue.empty()) {
            m_queue.pop_back();
            ++m_counts.lost;
        }
        m_queue.insert(m_queue.begin(), std::make_move_iterator(batch.begin()),
                       std::make_move_iterator(batch.end()));
        m_idle.notify_all();
        if (m_stop) return;
        m_wake.wait_for(lock, m_retry, [this] { return m_stop; });
    }
}

bool Journal::tryToWrite(std::vector<JournalEntry> const& batch, std::uint32_t next) {
    try {
        if (!m_file) m_file = std::make_unique<JournalFile>(m_path, m_limits);
        try {
            m_file->write(batch, next);
        } catch (DatabaseDamaged const& error) {
            setAside(error.what());
            m_file = std::make_unique<JournalFile>(m_path, m_limits);
            m_file->write(batch, next);
        }
        return true;
    } catch (std::exception const& error) {
        // Opened anew next time: the disk may have been exchanged.
        m_file.reset();
        std::scoped_lock const guard(m_mutex);
        noteFailure(error.what());
        return false;
    }
}

void Journal::setAside(std::string const& why) {
    m_file.reset();
    std::string const aside = nameForDamaged(m_path);
    std::error_code fault;
    std::filesystem::rename(m_path, aside, fault);
    if (fault) throw DatabaseFault(why + ", and it cannot be renamed: " + fault.message());
    for (char const* const part : {"-wal", "-shm"})
        std::filesystem::remove(m_path + part, fault);
    log(LogLevel::Warning, m_path + ": the journal is damaged (" + why + "); it is kept as " +
                               aside + ", and a new one is begun");
}

void Journal::noteFailure(std::string const& why) {
    if (std::exchange(m_counts.failing, true)) return;
    log(LogLevel::Warning, m_path + ": the journal cannot be written: " + why + "; up to " +
                               std::to_string(m_capacity) +
                               " entries wait in memory, and the agent keeps trying");
}

void Journal::noteSuccess(std::size_t entries) {
    m_counts.written += static_cast<std::uint32_t>(entries);
    if (!std::exchange(m_counts.failing, false)) return;
    log(LogLevel::Info, m_path + ": the journal can be written again; entries lost so far: " +
                            std::to_string(m_counts.lost));
}

} // namespace kvloamd
