// SPDX-License-Identifier: BSD-2-Clause
// What the agent says about itself in the system group.
#pragma once

#include <string>
#include <vector>

#include "agent/rows/Oid.h"

namespace kvloamd {

/// A row of sysORTable.
struct Capability {
    Oid id; ///< absolute
    std::string description;
};

/// The agent's rows: its capability statement, and each MIB module that it implements.
/// `enterprise`: the arc above KVL-OAM-MIB. `version`: the agent's.
std::vector<Capability> capabilities(Oid const& enterprise, std::string const& version);

/// sysDescr: the product, its version and the host on which it runs.
std::string systemDescription(std::string const& version);

/// sysObjectID: what identifies this agent among others.
Oid systemObjectId(Oid const& enterprise);

} // namespace kvloamd
