// SPDX-License-Identifier: BSD-2-Clause
// Reads the statistics of the processes that use the runtime library.
#pragma once

#include <vector>

#include "access/KPXStatisticsTable.h"
#include "agent/rows/ProcessRow.h"

namespace kvloamd {

/// All processes, ascending by id. On the thread that the table belongs to.
std::vector<ProcessRow> readProcesses(KPXStatisticsTable& table);

} // namespace kvloamd
