// SPDX-License-Identifier: BSD-2-Clause
// Tells boards and interfaces which physical entities they are.
#pragma once

#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// Fills in the entities of all boards and interfaces of `snapshot`. Requires that it has its
/// boards, interfaces and physical entities.
void noteWhereabouts(Snapshot& snapshot);

} // namespace kvloamd
