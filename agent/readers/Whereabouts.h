// SPDX-License-Identifier: BSD-2-Clause
// Tells boards and interfaces which physical entities they are, and interfaces whose they are.
#pragma once

#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// Fills in the `entity` of every board and interface of `snapshot`, and the serial number of every
/// interface's board. Requires that `snapshot` has its boards, interfaces and entities.
void noteWhereabouts(Snapshot& snapshot);

} // namespace kvloamd
