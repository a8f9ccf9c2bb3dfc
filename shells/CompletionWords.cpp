// SPDX-License-Identifier: BSD-2-Clause
// Walks the commands and options of a command line parser.
#include "shells/CompletionWords.h"

#include <cctype>

namespace shells {

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

/// The commands and option groups directly below; commands without a group are hidden.
std::vector<CLI::App const*> appsBelow(CLI::App const& app) {
    return app.get_subcommands([](CLI::App const* below) {
        return below->get_name().empty() || !below->get_group().empty();
    });
}

std::string lowerCase(std::string text) {
    for (char& c : text)
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    return text;
}

/// Adds the options and arguments of `app`, which is a command or a group of a command's options.
void addOptions(CLI::App const& app, std::set<std::string> const& namedTypes,
                CompletionCommand& command) {
    bool const isGroup = app.get_name().empty();
    for (auto const* option : app.get_options()) {
        if (isGroup && option == app.get_help_ptr()) continue; // the command has it already
        if (!option->get_positional()) {
            command.options.push_back(describeOption(*option));
            continue;
        }
        command.takesFile = command.takesFile || namesFile(*option);
        if (namedTypes.contains(option->get_type_name()))
            command.names = lowerCase(option->get_type_name());
    }
    for (auto const* below : appsBelow(app))
        if (below->get_name().empty()) addOptions(*below, namedTypes, command);
}

void walk(CLI::App const& app, std::string const& path,
          std::vector<CompletionOption> const& inherited, std::set<std::string> const& namedTypes,
          std::vector<CompletionCommand>& all) {
    std::size_t const index = all.size();
    {
        CompletionCommand& command = all.emplace_back();
        command.path = path;
        command.name = app.get_name();
        command.help = app.get_description();
        addOptions(app, namedTypes, command);
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
        walk(*below, belowPath, handedDown, namedTypes, all);
    }
}

} // namespace

std::vector<CompletionCommand> completionCommands(CLI::App const& app,
                                                  std::set<std::string> const& namedTypes) {
    std::vector<CompletionCommand> all;
    walk(app, "", {}, namedTypes, all);
    return all;
}

} // namespace shells
