// SPDX-License-Identifier: BSD-2-Clause
// Reads the part "processes" of a chassis.
#pragma once

#include <string_view>
#include <vector>

#include "simulator/chassis/ProcessDraft.h"
#include "simulator/description/Description.h"

namespace kvlsim {

/// Both throw ChassisError. A wrong process is a finding.
std::vector<ProcessDraft> readProcesses(Description const& processes, Findings& findings);
/// `counters` and `rates` are maps "name: number"; null: none.
Counters readCounters(Description const* counters, Description const* rates);
void refuseUnfitProcessName(std::string_view name, int line);

} // namespace kvlsim
