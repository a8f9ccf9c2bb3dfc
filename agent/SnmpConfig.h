// SPDX-License-Identifier: BSD-2-Clause
// Starts the SNMP library and has it read its own configuration.
#pragma once

#include <string>
#include <vector>

#include "agent/Options.h"

namespace kvloamd {

/// Starts the library and reads the configuration that `options` name. Returns what is wrong with
/// it, a line each. Called once, on the thread that does all SNMP, and followed by `stopSnmp`.
std::vector<std::string> startSnmp(Options const& options);

/// Where state is kept that outlives the process. After `startSnmp`.
std::string persistentDirectory(Options const& options);

/// Stores the state that outlives the process and lets go of everything.
void stopSnmp();

} // namespace kvloamd
