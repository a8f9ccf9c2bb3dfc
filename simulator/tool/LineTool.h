// SPDX-License-Identifier: BSD-2-Clause
// kvlsim line: lists DS1 lines, and gives them errors and alarms.
#pragma once

#include <functional>

#include <CLI/CLI.hpp>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// Adds the commands; the chosen one puts its action into `chosen`.
void addLineCommands(CLI::App& app, Connect connect, std::function<void()>& chosen);

} // namespace kvlsim
