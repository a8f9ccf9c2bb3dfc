// SPDX-License-Identifier: BSD-2-Clause
// Writes the completion scripts. Each script walks the words before the cursor, by a table of what
// a word means behind a command ("line list" or " --socket"), and offers what may follow there.
#include "shells/Completion.h"

#include <algorithm>
#include <iostream>
#include <ostream>
#include <string>
#include <string_view>

#include "shells/CompletionWords.h"

namespace shells {

namespace {

using Commands = std::vector<CompletionCommand>;

/// A text of a script, in which PROGRAM stands for the program's name.
std::string forProgram(std::string text, Commands const& commands) {
    constexpr std::string_view kPlace = "PROGRAM";
    std::string const& name = commands.front().name;
    for (auto at = text.find(kPlace); at != std::string::npos;
         at = text.find(kPlace, at + name.size()))
        text.replace(at, kPlace.size(), name);
    return text;
}

/// Whether the program lists names for some argument.
bool hasNames(Commands const& commands) {
    return std::ranges::any_of(commands,
                               [](auto const& command) { return !command.names.empty(); });
}

/// The program's own options that take a value.
std::vector<std::string> programOptions(Commands const& commands) {
    std::vector<std::string> options;
    for (auto const& option : commands.front().options)
        if (option.takesValue)
            options.insert(options.end(), option.names.begin(), option.names.end());
    return options;
}

/// `text` as one word of a POSIX shell, between single quotes.
std::string quoted(std::string const& text) {
    std::string result = "'";
    for (char const c : text)
        result += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return result + "'";
}

/// The same for fish, which knows two escapes between single quotes.
std::string fishQuoted(std::string const& text) {
    std::string result = "'";
    for (char const c : text) {
        if (c == '\'' || c == '\\') result += '\\';
        result += c;
    }
    return result + "'";
}

CompletionCommand const& commandAt(Commands const& commands, std::string const& path) {
    return *std::ranges::find(commands, path, &CompletionCommand::path);
}

/// The keys of a script's table: for each command, its options with a file name as the value or
/// with another value.
std::vector<std::string> valueKeys(Commands const& commands, bool files) {
    std::vector<std::string> keys;
    for (auto const& command : commands)
        for (auto const& option : command.options)
            if (option.takesValue && option.takesFile == files)
                for (auto const& name : option.names)
                    keys.push_back(quoted(command.path + " " + name));
    return keys;
}

/// The keys of the commands themselves; a command of the program's own has a blank before it.
std::vector<std::string> commandKeys(Commands const& commands) {
    std::vector<std::string> keys;
    for (auto const& command : commands)
        for (auto const& path : command.commands)
            keys.push_back(quoted(command.path.empty() ? " " + path : path));
    return keys;
}

void join(std::ostream& out, std::vector<std::string> const& words, char const* separator) {
    for (std::size_t i = 0; i < words.size(); ++i)
        out << (i == 0 ? "" : separator) << words[i];
}

/// One branch of a `case` of bash or zsh.
void branch(std::ostream& out, std::vector<std::string> const& keys, char const* action) {
    if (keys.empty()) return;
    out << "        ";
    join(out, keys, " | \\\n        ");
    out << ")\n            " << action << " ;;\n";
}

void printBash(std::ostream& out, Commands const& commands) {
    out << forProgram(R"(# bash completion for PROGRAM, printed by "PROGRAM completion bash"

_PROGRAM() {
    local word=${COMP_WORDS[COMP_CWORD]} command='' value='' words='' options='' file='' i
)",
                      commands);
    if (hasNames(commands)) out << "    local names='' option='' text='' given=()\n";
    out << R"(    COMPREPLY=()
    for ((i = 1; i < COMP_CWORD; ++i)); do
        if [[ -n $value ]]; then # of the option before; bash makes "=" a word of its own
            [[ ${COMP_WORDS[i]} == '=' ]] && continue
            value=''
)";
    if (hasNames(commands)) {
        out << R"(            text=${COMP_WORDS[i]}
            while ((i + 2 < COMP_CWORD)) && [[ ${COMP_WORDS[i + 1]} == ':' ]]; do # of HOST:PORT
                text+=:${COMP_WORDS[i + 2]}
                ((i += 2))
            done
            case "$option" in
            )";
        join(out, programOptions(commands), " | ");
        out << ") given+=(\"$option\" \"$text\") ;;\n            esac\n";
    }
    out << R"(            continue
        fi
)";
    if (hasNames(commands)) out << "        option=${COMP_WORDS[i]}\n";
    out << R"(        case "$command ${COMP_WORDS[i]}" in
)";
    branch(out, valueKeys(commands, true), "value=file");
    branch(out, valueKeys(commands, false), "value=other");
    branch(out, commandKeys(commands), R"(command="${command:+$command }${COMP_WORDS[i]}")");
    out << R"(        esac
    done
    if [[ -n $value ]]; then
        [[ $value != file ]] || compopt -o default 2>/dev/null
        return
    fi
    case "$command" in
)";
    for (auto const& command : commands) {
        std::vector<std::string> words;
        for (auto const& path : command.commands)
            words.push_back(commandAt(commands, path).name);
        std::vector<std::string> options;
        for (auto const& option : command.options)
            options.insert(options.end(), option.names.begin(), option.names.end());
        out << "        " << quoted(command.path) << ")\n            words='";
        join(out, words, " ");
        out << "'\n            options='";
        join(out, options, " ");
        out << "'\n";
        if (!command.names.empty()) out << "            names=" << command.names << '\n';
        out << "            file=" << (command.takesFile ? "yes" : "''") << " ;;\n";
    }
    out << R"(    esac
    if [[ $word == -* ]]; then
        COMPREPLY=($(compgen -W "$options" -- "$word"))
    elif [[ -n $words ]]; then
        COMPREPLY=($(compgen -W "$words" -- "$word"))
)";
    if (hasNames(commands))
        out << forProgram(R"script(    elif [[ -n $names ]]; then
        COMPREPLY=($(compgen -W "$(PROGRAM "${given[@]}" names "$names" 2>/dev/null)" -- "$word"))
)script",
                          commands);
    out << forProgram(R"(    elif [[ -n $file ]]; then
        compopt -o default 2>/dev/null
    fi
}

complete -F _PROGRAM PROGRAM
)",
                      commands);
}

/// "word:help", as zsh's `_describe` reads it.
std::string described(std::string const& word, std::string const& help) {
    return quoted(help.empty() ? word : word + ":" + help);
}

void printZsh(std::ostream& out, Commands const& commands) {
    out << forProgram(R"(#compdef PROGRAM
# zsh completion for PROGRAM, printed by "PROGRAM completion zsh"

_PROGRAM() {
    local cmd='' value='' file=''
)",
                      commands);
    if (hasNames(commands)) out << "    local names='' option=''\n    local -a given found\n";
    out << R"(    local -a subcommands switches
    integer i
    for ((i = 2; i < CURRENT; ++i)); do
        if [[ -n $value ]]; then
            value=''
)";
    if (hasNames(commands)) {
        out << "            case \"$option\" in\n            ";
        join(out, programOptions(commands), " | ");
        out << ") given+=(\"$option\" \"${(Q)words[i]}\") ;;\n            esac\n";
    }
    out << R"(            continue
        fi
)";
    if (hasNames(commands)) out << "        option=${words[i]}\n";
    out << R"(        case "$cmd ${words[i]}" in
)";
    branch(out, valueKeys(commands, true), "value=file");
    branch(out, valueKeys(commands, false), "value=other");
    branch(out, commandKeys(commands), R"(cmd="${cmd:+$cmd }${words[i]}")");
    out << R"(        esac
    done
    if [[ -n $value ]]; then
        [[ $value == file ]] && _files
        return
    fi
    case "$cmd" in
)";
    for (auto const& command : commands) {
        out << "        " << quoted(command.path) << ")\n            subcommands=(";
        for (auto const& path : command.commands) {
            auto const& below = commandAt(commands, path);
            out << "\n                " << described(below.name, below.help);
        }
        out << ")\n            switches=(";
        for (auto const& option : command.options)
            for (auto const& name : option.names)
                out << "\n                " << described(name, option.help);
        out << ")\n";
        if (!command.names.empty()) out << "            names=" << command.names << '\n';
        out << "            file=" << (command.takesFile ? "yes" : "''") << " ;;\n";
    }
    out << R"(    esac
    if [[ $PREFIX == -* ]]; then
        _describe -o option switches
    elif (( $#subcommands )); then
        _describe command subcommands
)";
    if (hasNames(commands))
        out << forProgram(R"script(    elif [[ -n $names ]]; then
        found=(${(f)"$(PROGRAM "${given[@]}" names "$names" 2>/dev/null)"})
        compadd -a found
)script",
                          commands);
    out << forProgram(R"(    elif [[ -n $file ]]; then
        _files
    fi
}

# zsh runs the file as the function when it is in $fpath; otherwise the file is sourced.
if [[ ${funcstack[1]} == _PROGRAM ]]; then
    _PROGRAM "$@"
else
    compdef _PROGRAM PROGRAM
fi
)",
                      commands);
}

/// One branch of fish's `switch`.
void fishBranch(std::ostream& out, std::vector<std::string> const& keys, char const* action) {
    if (keys.empty()) return;
    out << "            case ";
    join(out, keys, " \\\n                ");
    out << "\n                " << action << '\n';
}

void printFish(std::ostream& out, Commands const& commands) {
    out << forProgram(R"(# fish completion for PROGRAM, printed by "PROGRAM completion fish"

# Whether the words before the cursor name this command and end with no option that takes a value.
function __PROGRAM_at
    set -l words (commandline -opc)
    set -e words[1]
    set -l command ''
    set -l value ''
    for word in $words
        if test -n "$value"
            set value ''
            continue
        end
        switch "$command $word"
)",
                      commands);
    auto values = valueKeys(commands, true);
    auto const others = valueKeys(commands, false);
    values.insert(values.end(), others.begin(), others.end());
    fishBranch(out, values, "set value yes");
    fishBranch(out, commandKeys(commands), R"(set command (string trim "$command $word"))");
    out << R"(        end
    end
    test -z "$value"; and test "$command" = "$argv"
end
)";
    if (hasNames(commands)) {
        out << forProgram(R"(
# The names of things of a kind, from the program with those of its options that the command line has.
function __PROGRAM_names
    set -l given
    set -l option ''
    for word in (commandline -opc)
        switch "$option"
            case )",
                          commands);
        join(out, programOptions(commands), " ");
        out << forProgram(R"(
                set given $given $option $word
        end
        set option $word
    end
    PROGRAM $given names $argv 2>/dev/null
end
)",
                          commands);
    }
    out << forProgram("\ncomplete -c PROGRAM -f\n", commands);
    for (auto const& command : commands) {
        std::string const here =
            forProgram("complete -c PROGRAM -n ", commands) +
            fishQuoted(forProgram("__PROGRAM_at", commands) +
                       (command.path.empty() ? command.path : " " + command.path));
        for (auto const& path : command.commands) {
            auto const& below = commandAt(commands, path);
            out << here << " -a " << below.name << " -d " << fishQuoted(below.help) << '\n';
        }
        for (auto const& option : command.options) {
            out << here;
            for (auto const& name : option.names)
                out << (name.starts_with("--") ? " -l " + name.substr(2) : " -s " + name.substr(1));
            if (option.takesValue) out << (option.takesFile ? " -r -F" : " -x");
            out << " -d " << fishQuoted(option.help) << '\n';
        }
        if (command.takesFile) out << here << " -F\n";
        if (!command.names.empty())
            out << here << " -a "
                << fishQuoted(forProgram("(__PROGRAM_names ", commands) + command.names + ")")
                << '\n';
    }
}

} // namespace

void addCompletionCommands(CLI::App& app, std::function<void()>& chosen,
                           std::set<std::string> namedTypes) {
    CLI::App* const group =
        app.add_subcommand("completion", "Print a script that completes commands in a shell");
    group->fallthrough()->require_subcommand(1);
    struct {
        char const* shell;
        char const* help;
        void (*print)(std::ostream&, Commands const&);
    } static constexpr shells[] = {{"bash", "The script for bash", printBash},
                                   {"zsh", "The script for zsh", printZsh},
                                   {"fish", "The script for fish", printFish}};
    for (auto const& [shell, help, print] : shells) {
        CLI::App* const command = group->add_subcommand(shell, help);
        command->fallthrough();
        command->callback([&app, &chosen, namedTypes, print = print] {
            chosen = [&app, namedTypes, print] {
                print(std::cout, completionCommands(app, namedTypes));
            };
        });
    }
}

} // namespace shells
