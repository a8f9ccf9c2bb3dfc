// SPDX-License-Identifier: BSD-2-Clause
// The faults of a board that are alarms of its lines.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <optional>

#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// The platform reports an alarm of a line as a fault of its board, without the line. The fault
/// values are consecutive; the order is that of the platform's alarm bits: loss of signal, loss of
/// frame, AIS, RAI, sending RAI, sending AIS, loopback, AIS in time slot 16, loss of multiframe at
/// the far end, sending that, test code.
inline constexpr std::uint16_t kFirstLineFault = 256;
inline constexpr std::size_t kLineFaults = 11;

/// The position of a fault value among those of lines; nothing for any other value.
std::optional<std::size_t> lineFault(std::uint16_t value);

/// How many lines of a board show each line fault in their dsx1LineStatus.
struct ShownLineFaults {
    std::array<std::uint32_t, kLineFaults> lines{};
    bool allClear = true; ///< every line shows no alarm at all
};

/// The line faults that the lines show, by board index. A board without lines, or with a line whose
/// status is not known, is left out.
std::map<std::uint32_t, ShownLineFaults> shownLineFaults(InterfaceRows const& interfaces);

/// Whether a line that shows this fault implies that the platform reported it. A line that has lost
/// its signal or frame sends RAI by itself, so the alarms that a line sends do not.
bool impliesReport(std::size_t lineFault);

} // namespace kvloamd
