// SPDX-License-Identifier: BSD-2-Clause
// Statistics of the processes that use the platform's runtime library.
#pragma once

#include <ctime>

#include <map>
#include <string>

#include "boardplatform/kpx.h"
#include "platform/Export.h"

/// One row per process, walked by process id. The rows are read at most every ten seconds, so a
/// walk sees one snapshot as long as no refresh falls due.
///
/// Not synchronised: the table belongs to one thread.
class KVLOAM_API KPXStatisticsTable {
  public:
    /// The most processes that are seen.
    static constexpr int kCapacity = 101;

    /// Thrown by the getters for a process that is not in the table.
    class KVLOAM_API StatsErrorException {};

    /// The single instance, made by the first call and never destroyed.
    static KPXStatisticsTable* GetInstance();

    /// Reads all rows anew if the table is at least ten seconds old. Returns 1 if so, else 0.
    int CacheRefresh();
    /// Refreshes if due. The smallest process id, or -1.
    int GetFirstIndex();
    /// Never refreshes. The next larger process id, or -1 when `pid` is the last or is not in the
    /// table.
    int GetNextIndex(int pid);

    /// Each refreshes if due and answers for one process, or throws `StatsErrorException`.
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

    /// `clock` tells the time in seconds.
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
