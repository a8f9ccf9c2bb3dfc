// SPDX-License-Identifier: BSD-2-Clause
// Starts the SNMP library with its configuration.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "agent/fronts/Capabilities.h"
#include "agent/rows/Oid.h"

namespace kvloamd {

class Receivers;

/// Where the SNMP library reads its configuration and keeps its state.
struct SnmpFiles {
    std::string configuration;       ///< empty: in the directories in which the library looks
    std::string persistentDirectory; ///< empty: the library's default
    // Of the system group, unless the configuration sets them; empty: the library's default.
    std::string systemDescription;
    Oid systemObjectId;
};

/// Starts the library and reads the configuration that `files` name. Returns the configuration's
/// errors, one line for each. `receivers`, which outlives the library's run, takes the notification
/// receivers. Call it once, on the SNMP thread, and `stopSnmp` at the end.
std::vector<std::string> startSnmp(SnmpFiles const& files, Receivers& receivers);

/// Replaces communities, views, receivers and access by what the configuration says now, and adds
/// its users; users stay until the state is deleted. Returns the errors, one line for each. After
/// `startSnmp`.
std::vector<std::string> readSnmpConfigAgain();

/// The directory of the state that is kept across restarts. Valid after `startSnmp`.
std::string persistentDirectory(SnmpFiles const& files);

/// Enters a row in sysORTable. After `startSnmp`.
void addCapability(Capability const& capability);

/// The library's sysUpTime. After `startSnmp`.
std::uint32_t snmpUpTime();

/// Saves the state and stops the library.
void stopSnmp();

} // namespace kvloamd
