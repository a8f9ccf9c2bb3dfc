// SPDX-License-Identifier: BSD-2-Clause
// Scripts for bash, zsh and fish, which complete the command line of a program.
#pragma once

#include <functional>
#include <set>
#include <string>

#include <CLI/CLI.hpp>

namespace shells {

/// Adds `completion bash`, `completion zsh` and `completion fish`, which print a script made of all
/// commands and options of `app`, whose name is the program's. The chosen command puts its action
/// into `chosen`.
///
/// `namedTypes`: types of arguments, such as "BOARD", whose values the program itself lists. The
/// scripts then run `<program> names board`, with those options of the program that take a value,
/// and offer each line of the output. These lines must consist of letters, digits and signs that
/// mean nothing to a shell.
void addCompletionCommands(CLI::App& app, std::function<void()>& chosen,
                           std::set<std::string> namedTypes = {});

} // namespace shells
