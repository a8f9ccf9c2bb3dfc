// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/ProcessReader.h"

#include "agent/readers/Answers.h"

namespace kvloamd {

namespace {

ProcessRow readProcess(KPXStatisticsTable& table, int pid) {
    ProcessRow row;
    row.pid = static_cast<std::uint32_t>(pid);
    row.name = printable(table.GetApplicationName(pid));
    row.opens = static_cast<std::uint32_t>(table.GetNumberOfOpens(pid));
    row.closes = static_cast<std::uint32_t>(table.GetNumberOfCloses(pid));
    row.eventQueueSize = unlessNegative(table.GetEventQueueSize(pid));
    row.currentEvents = unlessNegative(table.GetCurrentEventsOnQueue(pid));
    row.maxEvents = unlessNegative(table.GetMaxEventsOnQueue(pid));
    row.totalEvents = static_cast<std::uint32_t>(table.GetTotalQueuedEvents(pid));
    row.handlers = unlessNegative(table.GetNumberOfHandlers(pid));
    return row;
}

} // namespace

std::vector<ProcessRow> readProcesses(KPXStatisticsTable& table) {
    // The walk refreshes at its first step only; reading a row may do so again.
    std::vector<int> pids;
    for (int pid = table.GetFirstIndex(); pid != -1; pid = table.GetNextIndex(pid))
        if (pid > 0) pids.push_back(pid);
    std::vector<ProcessRow> rows;
    for (int const pid : pids) {
        try {
            rows.push_back(readProcess(table, pid));
        } catch (KPXStatisticsTable::StatsErrorException const&) {
            continue; // it has ended since
        }
    }
    return rows;
}

} // namespace kvloamd
