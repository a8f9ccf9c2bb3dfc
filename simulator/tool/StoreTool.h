// SPDX-License-Identifier: BSD-2-Clause
// kvlsim store: lists and changes the records of the attribute store.
#pragma once

#include <functional>

#include <CLI/CLI.hpp>

#include "simulator/tool/ControlClient.h"

namespace kvlsim {

/// Adds the commands; the chosen one puts its action into `chosen`.
void addStoreCommands(CLI::App& app, Connect connect, std::function<void()>& chosen);

} // namespace kvlsim
