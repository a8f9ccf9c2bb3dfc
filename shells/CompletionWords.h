// SPDX-License-Identifier: BSD-2-Clause
// The words that a command line may have, as its parser knows them.
#pragma once

#include <set>
#include <string>
#include <vector>

#include <CLI/CLI.hpp>

namespace shells {

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
    std::string
        names; ///< what one of its arguments is, such as "board"; empty: nothing that is listed
};

/// The program first, each command before those below it, without commands that the help hides. An
/// option or argument whose type is named "FILE" takes a file name. An argument whose type is one
/// of `namedTypes` takes a name that the program lists.
std::vector<CompletionCommand> completionCommands(CLI::App const& app,
                                                  std::set<std::string> const& namedTypes = {});

} // namespace shells
