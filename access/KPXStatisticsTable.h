// SPDX-License-Identifier: BSD-2-Clause
// Statistics of the processes that use the platform's runtime library.
#pragma once

#include <ctime>

#include <map>
#include <string>

#include "boardplatform/kpx.h"
#include "platform/Export.h"

/// A `KPXStatisticsTable` has one row per process, walked by process id. It reads the rows at most
/// every ten seconds, so a walk sees one snapshot unless a refresh is due meanwhile.
///
/// Thread-bound: one thread uses the table.
class KVLOAM_API KPXStatisticsTable {
  public:
    /// The largest number of processes in the table.
    static constexpr int kCapacity = 101;

    /// Thrown by the getters for a process that is not in the table.
    class KVLOAM_API StatsErrorException {};

    /// The single instance, created by the first call and never destroyed.
    static KPXStatisticsTable* GetInstance();

    /// Reads all rows anew if the table is at least ten seconds old. Returns 1 if it did, otherwise
    /// 0.
    int CacheRefresh();
    /// Refreshes if due. Returns the smallest process id, or -1.
    int GetFirstIndex();
    /// Never refreshes. Returns the next larger process id, or -1 if `pid` is the last or is not in
    /// the table.
    int GetNextIndex(int pid);

    /// Each refreshes if due and returns a value of one process, or throws `StatsErrorException`.
    std::string GetApplicationName(int pid);
    int GetNumberOfOpens(int pid);
    int GetNumberOfCloses(int pid);
    int GetEventQueueSize(int pid);
    int GetCurrentEventsOnQueue(int pid);
    int GetMaxEventsOnQueue(int pid);
    int GetTotalQueuedEvents(int pid);
    int GetNumberOfHandlers(int pid);

  protected:
    using Clock = std::time_t();

    /// `clock` returns the time in seconds.
    explicit KPXStatisticsTable(Clock* clock);

  private:
    tag_KPXSTATISTICS const& row(int pid);

    std::time_t m_lastRefresh = 0;
    int m_count = 0;
    tag_KPXSTATISTICS m_records[kCapacity] = {};
    int m_pids[kCapacity] = {};
    std::map<unsigned int, tag_KPXSTATISTICS> m_cache;
    Clock* m_clock;

    static KPXStatisticsTable* s_instance;
};
