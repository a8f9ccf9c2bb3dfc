// SPDX-License-Identifier: BSD-2-Clause
// Walks the commands and options of a command line parser.
#include "simulator/tool/CompletionWords.h"

namespace kvlsim {

namespace {

bool namesFile(CLI::Option const& option) {
    return option.get_type_name() == "FILE";
}

CompletionOption describeOption(CLI::Option const& option) {
    CompletionOption result;
    for (auto const& name : option.get_snames())
        result.names.push_back("-" + name);
    for (auto const& name : option.get_lnames())
        result.names.push_back("--" + name);
    result.help = option.get_description();
    result.takesValue = option.get_items_expected_max() > 0;
    result.takesFile = result.takesValue && namesFile(option);
    return result;
}

std::vector<CLI::App const*> appsBelow(CLI::App const& app) {
    return app.get_subcommands([](auto const*) { return true; });
}

/// Adds the options and arguments of `app`, which is a command or a group of a command's options.
void addOptions(CLI::App const& app, CompletionCommand& command) {
    bool const isGroup = app.get_name().empty();
    for (auto const* option : app.get_options()) {
        if (isGroup && option == app.get_help_ptr()) continue; // the command has it already
        if (option->get_positional())
            command.takesFile = command.takesFile || namesFile(*option);
        else
            command.options.push_back(describeOption(*option));
    }
    for (auto const* below : appsBelow(app))
        if (below->get_name().empty()) addOptions(*below, command);
}

void walk(CLI::App const& app, std::string const& path,
          std::vector<CompletionOption> const& inherited, std::vector<CompletionCommand>& all) {
    std::size_t const index = all.size();
    {
        CompletionCommand& command = all.emplace_back();
        command.path = path;
        command.name = app.get_name();
        command.help = app.get_description();
        addOptions(app, command);
        command.options.insert(command.options.end(), inherited.begin(), inherited.end());
    }

    // A command takes the options of those above it too, but has help of its own.
    std::vector<CompletionOption> handedDown = inherited;
    for (auto const* option : app.get_options())
        if (!option->get_positional() && option != app.get_help_ptr() &&
            option != app.get_version_ptr())
            handedDown.push_back(describeOption(*option));

    for (auto const* below : appsBelow(app)) {
        if (below->get_name().empty()) continue;
        std::string const belowPath = (path.empty() ? path : path + " ") + below->get_name();
        all[index].commands.push_back(belowPath);
        walk(*below, belowPath, handedDown, all);
    }
}

} // namespace

std::vector<CompletionCommand> completionCommands(CLI::App const& app) {
    std::vector<CompletionCommand> all;
    walk(app, "", {}, all);
    return all;
}

} // namespace kvlsim
