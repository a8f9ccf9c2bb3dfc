// SPDX-License-Identifier: BSD-2-Clause
// The clock by which the agent measures times of its own.
#pragma once

#include <chrono>

namespace kvloamd {

/// Steps of the time of day do not move it.
using Clock = std::chrono::steady_clock;

} // namespace kvloamd
