// SPDX-License-Identifier: BSD-2-Clause
// The agent from its start to its end.
#pragma once

#include <functional>
#include <variant>

#include "agent/daemon/Options.h"

namespace kvloamd {

/// Reads the options anew, from where the first ones came.
using ReadOptions = std::function<std::variant<Options, Exit>()>;

/// Starts everything, serves until SIGTERM or SIGINT, stops. SIGHUP has the options read again.
/// Returns the process's exit status; what went wrong has been logged. Called once, on the main
/// thread, before any other thread is started.
int runDaemon(Options const& options, ReadOptions const& readAgain);

/// Checks what can be checked without starting: modules, configuration. Returns the exit status;
/// what is wrong has been logged.
int checkConfiguration(Options const& options);

} // namespace kvloamd
