// SPDX-License-Identifier: BSD-2-Clause
// Runs the agent.
#pragma once

#include <functional>
#include <variant>

#include "agent/daemon/Options.h"

namespace kvloamd {

/// Reads the options again from where they were read at the start.
using ReadOptions = std::function<std::variant<Options, Exit>()>;

/// Starts the agent, serves until SIGTERM or SIGINT, and stops. SIGHUP reads the options again.
/// Returns the exit status of the process; errors have been logged. Requires that it is called
/// once, on the main thread, before any other thread is started.
int runDaemon(Options const& options, ReadOptions const& readAgain);

} // namespace kvloamd
