// SPDX-License-Identifier: BSD-2-Clause
// kvlsim process: lists, adds and ends the processes of the runtime library.
#pragma once

#include <functional>

#include <CLI/CLI.hpp>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// Adds the commands; the chosen one puts its action into `chosen`.
void addProcessCommands(CLI::App& app, Connect connect, std::function<void()>& chosen);

} // namespace kvlsim
