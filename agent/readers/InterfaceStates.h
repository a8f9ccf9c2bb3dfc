// SPDX-License-Identifier: BSD-2-Clause
// The states of interfaces that stand on others.
#pragma once

#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// Completes the states of interfaces whose stack is known, by the rules of RFC 2863:
///
/// - What cannot be taken down is administratively up, and an interface whose state is not known
///   has the state unknown.
/// - An interface that stands on others is lowerLayerDown while all of them are down, testing, not
///   present, or lowerLayerDown themselves.
/// - ifLinkUpDownTrapEnable is by default disabled for interfaces that stand on others, and for
///   DS0s, whose line may not be known.
///
/// The interfaces in `rows.stack` are meant by their `ifIndex`.
void completeStates(BoardInterfaceRows& rows);

} // namespace kvloamd
