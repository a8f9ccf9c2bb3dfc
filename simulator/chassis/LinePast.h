// SPDX-License-Identifier: BSD-2-Clause
// A line's past, second by second.
#pragma once

#include <functional>

#include "simulator/chassis/LineDraft.h"

namespace kvlsim {

/// The line at loading; its age is the length of its past.
Line lineAtLoading(LineDraft const& draft);
/// Calls `record` with the counters of every second of the past, the first and the last included.
void replayPast(LinePast const& past, std::function<void(DS1LineCounters const&)> const& record);

} // namespace kvlsim
