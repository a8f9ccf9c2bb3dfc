// SPDX-License-Identifier: BSD-2-Clause
// Made-up lines with a full day of intervals, and where the table of them is served.
#pragma once

#include <cstdint>

#include "agent/objects/Value.h"
#include "agent/rows/Snapshot.h"

inline constexpr std::uint32_t kIntervalsOfALine = 96;
inline constexpr std::uint32_t kCounters = 10;
/// The number of the first counter's column; two index columns are before.
inline constexpr std::uint32_t kFirstCounterColumn = 3;

/// Lines have the indices from this on.
inline constexpr std::uint32_t kFirstLine = 1000;

/// Where the agent under test serves DS1-MIB's interval table; its entry.
inline kvloamd::Oid const kOurArc{1, 3, 6, 1, 4, 1, 32473, 90};
inline kvloamd::Oid const kOurPlace{10, 18};
inline kvloamd::Oid const kOurEntry{1, 3, 6, 1, 4, 1, 32473, 90, 10, 18, 8, 1};
/// Where the peers serve the same; their tables and their entries.
inline kvloamd::Oid const kTableDataPlace{1, 3, 6, 1, 4, 1, 32473, 91, 10, 18, 8};
inline kvloamd::Oid const kIteratorPlace{1, 3, 6, 1, 4, 1, 32473, 92, 10, 18, 8};
inline kvloamd::Oid const kTableDataEntry{1, 3, 6, 1, 4, 1, 32473, 91, 10, 18, 8, 1};
inline kvloamd::Oid const kIteratorEntry{1, 3, 6, 1, 4, 1, 32473, 92, 10, 18, 8, 1};

/// A snapshot with nothing but `lines` lines.
kvloamd::Snapshot makeIntervals(std::uint32_t lines);
