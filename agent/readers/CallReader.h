// SPDX-License-Identifier: BSD-2-Clause
// Reads what ISDN channels say about calls and about the data link.
#pragma once

#include <functional>

#include "agent/rows/InterfaceRows.h"
#include "board/ISDNChannel.h"

namespace kvloamd {

/// Fills the call of a bearer channel. `toTicks`: see `BoardInterfaces.h`.
void readCall(ISDNBChannel& channel, std::function<std::uint32_t(long)> const& toTicks,
              BearerRow& row);
/// Fills what a signalling channel counts. What it does not count is not known.
void readCounts(ISDNDChannel& channel, SignallingRow& row);
void readCounts(ISDNDChannel& channel, LapdRow& row);

} // namespace kvloamd
