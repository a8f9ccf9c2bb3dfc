// SPDX-License-Identifier: BSD-2-Clause
// kvlsim call: lists ISDN channels, sets calls up and releases them, also from a script.
#pragma once

#include <functional>

#include <CLI/CLI.hpp>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// Adds the commands; the chosen one puts its action into `chosen`.
void addCallCommands(CLI::App& app, Connect connect, std::function<void()>& chosen);

} // namespace kvlsim
