// SPDX-License-Identifier: BSD-2-Clause
// Checks a configuration without starting the agent.
#pragma once

#include "agent/daemon/Options.h"

namespace kvloamd {

/// Checks everything that a start needs: platform, modules, persistent directory, SNMP
/// configuration and addresses. Returns the exit status; errors have been logged.
int checkConfiguration(Options const& options);

/// Checks the SNMP configuration only.
int checkSnmpConfiguration(Options const& options);

} // namespace kvloamd
