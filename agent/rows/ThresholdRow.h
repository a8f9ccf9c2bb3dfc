// SPDX-License-Identifier: BSD-2-Clause
// The limits on what a line may count.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>

#include "agent/rows/Settings.h"

namespace kvloamd {

/// What a limit is on: a counter of DS1-MIB, within 15 minutes or within 24 hours. In the order of
/// kvlThresholdTable's columns.
enum Threshold : std::size_t {
    kErroredSeconds15m,
    kErroredSeconds24h,
    kSeverelyErroredSeconds15m,
    kSeverelyErroredSeconds24h,
    kUnavailableSeconds15m,
    kUnavailableSeconds24h,
    kControlledSlipSeconds15m,
    kControlledSlipSeconds24h,
    kCodeViolations15m,
    kCodeViolations24h,
    kThresholds ///< how many
};

/// The limits on one line; 0: none.
using LineLimits = std::array<int, kThresholds>;

/// The setting of a line's own limit, which overrides that of its type.
constexpr Setting thresholdSetting(std::size_t threshold) {
    return static_cast<Setting>(static_cast<int>(Setting::FirstThreshold) +
                                static_cast<int>(threshold));
}

/// A line that keeps a history.
struct ThresholdRow {
    std::uint32_t ifIndex = 0;
    LineLimits limits{}; ///< of the line's type

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
};

} // namespace kvloamd
