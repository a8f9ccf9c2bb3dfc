// SPDX-License-Identifier: BSD-2-Clause
// Chooses how the agent is reached.
#pragma once

#include <memory>

#include "agent/daemon/Options.h"
#include "agent/fronts/Front.h"
#include "agent/fronts/snmp/SnmpConfig.h"

namespace kvloamd {

/// The front that `options` ask for. Throws std::runtime_error.
std::unique_ptr<Front> makeFront(Options const& options);

/// The files of the SNMP library that `options` name.
SnmpFiles snmpFiles(Options const& options);

} // namespace kvloamd
