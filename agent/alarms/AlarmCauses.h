// SPDX-License-Identifier: BSD-2-Clause
// Which alarms follow from which others.
#pragma once

#include <cstdint>
#include <span>

#include "agent/alarms/AlarmKinds.h"

namespace kvloamd {

/// Where the cause of a consequence is.
enum class CausedBy {
    Board,       ///< the same board
    Interface,   ///< the same line
    LineBelow,   ///< the line that the channel is on
    LineOfBoard, ///< any line of the same board
    Agent        ///< the agent
};

/// While `cause` is active, `consequence` is no alarm of its own.
struct AlarmCause {
    AlarmKind consequence;
    AlarmKind cause;
    CausedBy where;
    std::uint32_t fault = 0; ///< of a platform fault: the fault value
};

/// The causes of a kind of alarm, the one furthest from it first: board, line, channel. `number`:
/// of the alarm; the fault value of a platform fault.
std::span<AlarmCause const> causesOf(AlarmKind consequence, std::uint32_t number);
/// Whether alarms of this kind have consequences.
bool isCause(AlarmKind kind);

} // namespace kvloamd
