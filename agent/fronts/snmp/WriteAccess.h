// SPDX-License-Identifier: BSD-2-Clause
// Restricts writers that have no view of their own.
#pragma once

#include <vector>

#include "agent/objects/ServedTree.h"

namespace kvloamd {

/// Restricts every configured user and community that may write the whole tree to the places of
/// `trees`, where only the settings can be written. Those with a view of their own keep it.
/// Thread-bound to the SNMP thread; called after the SNMP library has read its configuration.
void restrictWriters(std::vector<ServedTree> const& trees);

} // namespace kvloamd
