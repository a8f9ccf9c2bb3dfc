// SPDX-License-Identifier: BSD-2-Clause
// Counters of 32 bits become counters of 64.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <span>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// How much an interface can have counted between two readings.
struct CountLimits {
    std::uint64_t octets;
    std::uint64_t others; ///< packets, frames, errors
};

/// For an interface of `speed` bit/s; nothing: it is not known.
CountLimits countLimits(std::optional<std::uint32_t> speed, Clock::duration elapsed);

using LongCounter = std::optional<std::uint64_t>;

/// Whether one of the counters has begun again. A counter that is lower than before has wrapped if
/// the interface can have counted that much since then; otherwise it began again at 0. The low 32
/// bits of `totals` are the former readings. `limits`: of each counter.
bool hasRestarted(std::span<LongCounter const> totals, std::span<LongCounter const> read,
                  std::span<std::uint64_t const> limits);

/// Adds what has been counted since `totals` to them, and makes `read` the same. Counters that are
/// not known now are left alone.
void countOn(std::span<LongCounter> totals, std::span<LongCounter> read);

} // namespace kvloamd
