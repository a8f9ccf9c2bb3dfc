// SPDX-License-Identifier: BSD-2-Clause
#include "access/KPXStatisticsTable.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>
#include <memory>
#include <string_view>

namespace {

constexpr std::time_t kMaxAge = 9; // seconds

/// Puts the name of the process's program into `record`. If the process's command line cannot be
/// opened, the platform's name stays.
void readProgramName(int pid, tag_KPXSTATISTICS& record) {
    std::array<char, 32> path{};
    std::snprintf(path.data(), path.size(), "/proc/%d/cmdline", pid);
    std::unique_ptr<std::FILE, int (*)(std::FILE*)> const file(std::fopen(path.data(), "r"),
                                                               std::fclose);
    if (file == nullptr) return;
    std::memset(record.name, 0, sizeof record.name);
    std::array<char, 256> line{};
    if (std::fgets(line.data(), line.size(), file.get()) == nullptr) return;
    std::string_view name = line.data();
    // Without a slash npos + 1 is 0: the whole text.
    name.remove_prefix(name.rfind('/') + 1);
    std::copy_n(name.data(), std::min(name.size(), sizeof record.name), record.name);
}

} // namespace

KPXStatisticsTable* KPXStatisticsTable::s_instance = nullptr;

KPXStatisticsTable::KPXStatisticsTable(Clock* clock) : m_clock(clock) {}

KPXStatisticsTable* KPXStatisticsTable::GetInstance() {
    if (s_instance == nullptr)
        s_instance = new KPXStatisticsTable([] { return std::time(nullptr); });
    return s_instance;
}

int KPXStatisticsTable::CacheRefresh() {
    if (m_clock() - m_lastRefresh <= kMaxAge) return 0;
    m_count = std::min(_kp_getpids(m_pids, kCapacity), kCapacity);
    for (int i = 0; i < m_count; ++i) {
        if (_kp_getstatsbypid(m_pids[i], &m_records[i]) == -1)
            m_pids[i] = -1;
        else
            readProgramName(m_pids[i], m_records[i]);
    }
    m_cache.clear();
    for (int i = 0; i < m_count; ++i)
        if (m_pids[i] != -1)
            m_cache.insert_or_assign(static_cast<unsigned int>(m_pids[i]), m_records[i]);
    m_lastRefresh = m_clock();
    return 1;
}

int KPXStatisticsTable::GetFirstIndex() {
    CacheRefresh();
    return m_cache.empty() ? -1 : static_cast<int>(m_cache.begin()->first);
}

int KPXStatisticsTable::GetNextIndex(int pid) {
    auto entry = m_cache.find(static_cast<unsigned int>(pid));
    if (entry == m_cache.end() || ++entry == m_cache.end()) return -1;
    return static_cast<int>(entry->first);
}

tag_KPXSTATISTICS const& KPXStatisticsTable::row(int pid) {
    CacheRefresh();
    auto const found = m_cache.find(static_cast<unsigned int>(pid));
    if (found == m_cache.end()) throw StatsErrorException();
    return found->second;
}

std::string KPXStatisticsTable::GetApplicationName(int pid) {
    char const* const name = row(pid).name;
    return {name, strnlen(name, sizeof tag_KPXSTATISTICS::name)};
}

int KPXStatisticsTable::GetNumberOfOpens(int pid) {
    return row(pid).numberOfOpens;
}
int KPXStatisticsTable::GetNumberOfCloses(int pid) {
    return row(pid).numberOfCloses;
}
int KPXStatisticsTable::GetEventQueueSize(int pid) {
    return row(pid).eventQueueSize;
}
int KPXStatisticsTable::GetCurrentEventsOnQueue(int pid) {
    return row(pid).currentEventsOnQueue;
}
int KPXStatisticsTable::GetMaxEventsOnQueue(int pid) {
    return row(pid).maxEventsOnQueue;
}
int KPXStatisticsTable::GetTotalQueuedEvents(int pid) {
    return row(pid).totalQueuedEvents;
}
int KPXStatisticsTable::GetNumberOfHandlers(int pid) {
    return row(pid).numberOfHandlers;
}
