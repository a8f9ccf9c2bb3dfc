// SPDX-License-Identifier: BSD-2-Clause
// The limits that operators have configured for types of lines.
#pragma once

#include <array>
#include <optional>
#include <string>
#include <string_view>

#include "agent/alarms/AlarmKinds.h"
#include "agent/rows/ThresholdRow.h"

namespace kvloamd {

/// The kind of the alarm that a line has reached the limit.
AlarmKind thresholdKind(std::size_t threshold);
/// What the configuration calls the limit, such as "es15m".
char const* thresholdName(std::size_t threshold);

/// A `TypeLimits` holds the limits of lines by their type. None is set until it is configured.
/// Unsynchronised.
class TypeLimits {
  public:
    /// Reads one entry of the configuration, such as "t1=es15m=65,es24h=648,uas15m=10". The types
    /// are t1, e1 and j1. Returns a message if the entry is wrong, and then changes nothing; empty
    /// if it is right.
    std::string configure(std::string_view entry);

    /// `lineType`: dsx1LineType. A line that is neither T1 nor E1 nor J1 has no limits.
    LineLimits of(std::optional<int> lineType) const;

    bool operator==(TypeLimits const&) const = default;

  private:
    static constexpr std::size_t kTypes = 3;

    std::array<std::optional<LineLimits>, kTypes> m_limits;
};

} // namespace kvloamd
