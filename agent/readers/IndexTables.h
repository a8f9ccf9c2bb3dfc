// SPDX-License-Identifier: BSD-2-Clause
// The tables of indices in a state file.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "agent/readers/Database.h"
#include "agent/rows/IndexKey.h"

namespace kvloamd {

/// No index is above this.
inline constexpr std::uint32_t kLastIndex = 0x7fffffff;

/// Indices that belong to one board: `first` to `first + size - 1`. The name of its
/// `BoardKey` identifies the board.
struct IndexBlock {
    std::string board;
    std::uint32_t first = 0;
    std::uint32_t size = 0;
};

struct IndexEntry {
    std::string board;
    IndexKey key;
    std::uint32_t index = 0;
};

/// On which of the agent's days a board was present last.
struct BoardSeen {
    std::string board;
    std::int64_t day = 0;
};

/// The agent's own count of days: those on which it has run. Setting the host's clock forward or
/// back counts one day at most.
struct Calendar {
    std::int64_t day = 0;  ///< of the agent
    std::int64_t date = 0; ///< the same day, counted from the epoch
};

/// Every entry lies in a block of its board; blocks do not overlap.
struct IndexRecords {
    std::vector<IndexBlock> blocks;
    std::vector<IndexEntry> entries;
    std::vector<BoardSeen> seen;
    std::vector<std::string> forgotten; ///< boards whose records are to be deleted
    Calendar calendar;
};

// All of them throw `DatabaseFault`.

void createIndexTables(Database& database);
/// Checks and reads the tables. Throws `DatabaseDamaged` if they contradict each other.
IndexRecords readIndexTables(Database& database);
void deleteIndices(Database& database);
void writeIndices(Database& database, IndexRecords const& records);

} // namespace kvloamd
