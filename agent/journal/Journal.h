// SPDX-License-Identifier: BSD-2-Clause
// The event journal: what happened while nobody looked.
#pragma once

#include <atomic>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "agent/journal/JournalFile.h"
#include "agent/rows/JournalRow.h"

namespace kvloamd {

/// A `Journal` numbers events and writes them to its file on a thread of its own.
///
/// `append` never waits for the disk: entries wait in a bounded queue. While the file cannot be
/// written, it retries; entries that find the queue full are lost, and counted. The log says when
/// writing begins to fail and when it works again. A damaged file is renamed to
/// `<name>.damaged-<date>`, and begun anew. Thread-safe.
class Journal {
  public:
    /// Twice what a chassis reports that loses 4,000 lines at once, with their notifications.
    static constexpr std::size_t kQueue = 65536;
    /// The pause before a write that has failed is tried again.
    static constexpr std::chrono::milliseconds kRetry{1000};

    struct Counts {
        std::uint32_t written = 0; ///< entries
        std::uint32_t lost = 0;    ///< entries
        std::uint32_t last = 0;    ///< the sequence number given last; 0: none
        bool failing = false;      ///< the file cannot be written now
    };

    /// Opens the file on the calling thread. `path` is empty: nothing is kept, which is not logged.
    explicit Journal(std::string path, JournalLimits limits = {}, std::size_t queue = kQueue,
                     std::chrono::milliseconds retry = kRetry);
    /// As `close` with the alarms as they were written.
    ~Journal();
    Journal(Journal const&) = delete;
    Journal& operator=(Journal const&) = delete;

    /// The alarms that were active at the end of the last run.
    std::vector<Alarm> const& formerAlarms() const { return m_former; }

    /// The newest notifications of earlier runs, the oldest first, at most
    /// `NotificationLog::kCapacity`. To be taken once.
    std::vector<JournalEntry> takeFormerNotifications() {
        return std::exchange(m_formerNotifications, {});
    }

    /// Gives the entry the next sequence number, which it returns, and queues it. After `close` it
    /// only gives numbers.
    std::uint32_t append(JournalEntry entry);
    /// Writes what is queued, and the alarms that are active now, and ends the thread. Does not
    /// retry.
    void close(std::vector<Alarm> const& active);
    /// Waits until everything that has been appended is written, or writing has failed.
    void flush() const;

    Counts counts() const;

    /// The sequence number of the newest entry that can be read; 0: none. Costs nothing.
    std::uint32_t newest() const { return m_newest; }
    /// At most `limit` entries whose numbers are above `number`, the oldest of them first. Entries
    /// that still wait to be written are not among them. Opens the file anew and may wait for the
    /// disk, but neither for the writing thread nor for `append`, and delays neither: never call it
    /// on the SNMP thread. Nothing if the file cannot be read.
    std::optional<JournalPage> entriesAfter(std::uint32_t number, std::size_t limit) const;
    /// The same for the newest entries.
    std::optional<JournalPage> newestEntries(std::size_t limit) const;

  private:
    void open();
    void run();
    /// Writes a batch. False when it must be tried again.
    bool tryToWrite(std::vector<JournalEntry> const& batch, std::uint32_t next);
    void setAside(std::string const& why);
    void noteFailure(std::string const& why);
    void noteSuccess(std::size_t entries);

    std::string const m_path;
    JournalLimits const m_limits;
    std::size_t const m_capacity;
    std::chrono::milliseconds const m_retry;
    std::vector<Alarm> m_former;
    std::vector<JournalEntry> m_formerNotifications;
    std::atomic<std::uint32_t> m_newest{0}; ///< on disk
    std::unique_ptr<JournalFile> m_file;    ///< of the thread, once it runs; null: not open

    mutable std::mutex m_mutex; ///< guards what follows
    std::condition_variable m_wake;
    mutable std::condition_variable m_idle;
    std::deque<JournalEntry> m_queue;
    std::uint32_t m_next = 1;
    Counts m_counts;
    bool m_writing = false;
    bool m_stop = false;
    bool m_closed = false;

    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
