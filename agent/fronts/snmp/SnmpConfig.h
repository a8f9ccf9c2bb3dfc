// SPDX-License-Identifier: BSD-2-Clause
// Starts the SNMP library and has it read its own configuration.
#pragma once

#include <string>
#include <vector>

namespace kvloamd {

/// Where the SNMP library reads its configuration and keeps its state.
struct SnmpFiles {
    std::string configuration;       ///< empty: where the library looks by itself
    std::string persistentDirectory; ///< empty: the library's own
};

/// Starts the library and reads the configuration that `files` name. Returns what is wrong with
/// it, a line each. Called once, on the thread that does all SNMP, and followed by `stopSnmp`.
std::vector<std::string> startSnmp(SnmpFiles const& files);

/// Where state is kept that outlives the process. After `startSnmp`.
std::string persistentDirectory(SnmpFiles const& files);

/// Stores the state that outlives the process and lets go of everything.
void stopSnmp();

} // namespace kvloamd
