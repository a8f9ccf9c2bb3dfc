// SPDX-License-Identifier: BSD-2-Clause
// The agent from its start to its end.
#pragma once

#include "agent/Options.h"

namespace kvloamd {

/// Starts everything, serves until SIGTERM or SIGINT, stops. Returns the process's exit status;
/// what went wrong has been logged. Called once, on the main thread, before any other thread is
/// started.
int runDaemon(Options const& options);

/// Checks what can be checked without starting: modules, configuration. Returns the exit status;
/// what is wrong has been logged.
int checkConfiguration(Options const& options);

} // namespace kvloamd
