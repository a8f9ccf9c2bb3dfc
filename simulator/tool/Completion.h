// SPDX-License-Identifier: BSD-2-Clause
// kvlsim's scripts for bash, zsh and fish, which complete its command line.
#pragma once

#include <functional>

#include <CLI/CLI.hpp>

namespace kvlsim {

/// Adds `completion bash`, `completion zsh` and `completion fish`, which print a script made of all
/// commands and options of `app`. The chosen command puts its action into `chosen`.
void addCompletionCommands(CLI::App& app, std::function<void()>& chosen);

} // namespace kvlsim
