// SPDX-License-Identifier: BSD-2-Clause
// The requests that read columns of the interval table from end to end.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "LeanClient.h"

inline constexpr int kRepetitions = 50;

/// Requests for `columns` of the table with this entry, each one column or all in one; in a table
/// of `lines` lines from its begin to its end.
std::vector<std::string> requestsFor(kvloamd::Oid const& entry,
                                     std::vector<std::uint32_t> const& columns,
                                     std::uint32_t lines);

/// The counters' columns.
std::vector<std::uint32_t> counterColumns();

/// Reads the counters of a table's first `lines` lines with `client` and compares them with what
/// was made up. Throws std::runtime_error when anything is wrong or missing.
void checkTable(LeanClient& client, kvloamd::Oid const& entry, std::uint32_t lines);
