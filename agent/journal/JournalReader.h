// SPDX-License-Identifier: BSD-2-Clause
// Reads the journal's file while it is being written.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

#include "agent/rows/JournalRow.h"

namespace kvloamd {

/// Reads at most `limit` entries above the number `after`, or the newest ones, by a connection of
/// its own. `newest`: the number of the newest entry; nothing is read if it is 0. Nothing if the
/// file cannot be read. Thread-safe.
std::optional<JournalPage> readJournal(std::string const& path, std::optional<std::uint32_t> after,
                                       std::size_t limit, std::uint32_t newest);

} // namespace kvloamd
