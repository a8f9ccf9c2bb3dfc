// SPDX-License-Identifier: BSD-2-Clause
// The words that a command line may have, as its parser knows them.
#pragma once

#include <string>
#include <vector>

#include <CLI/CLI.hpp>

namespace kvlsim {

/// A `CompletionOption` is an option that a command takes.
struct CompletionOption {
    std::vector<std::string> names; ///< with their dashes, such as "-h" and "--help"
    std::string help;
    bool takesValue = false;
    bool takesFile = false; ///< its value is a file name
};

/// A `CompletionCommand` is what may follow one command, or the program's own name.
struct CompletionCommand {
    std::string path; ///< such as "line list"; empty: the program itself
    std::string name; ///< the last word of `path`
    std::string help;
    std::vector<CompletionOption> options; ///< those of the commands above it included
    std::vector<std::string> commands;     ///< the paths of the commands directly below it
    bool takesFile = false;                ///< one of its arguments is a file name
};

/// The program first, each command before those below it. An option or argument whose type is named
/// "FILE" takes a file name.
std::vector<CompletionCommand> completionCommands(CLI::App const& app);

} // namespace kvlsim
