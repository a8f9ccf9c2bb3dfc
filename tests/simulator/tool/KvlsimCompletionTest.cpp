// SPDX-License-Identifier: BSD-2-Clause
// The scripts that kvlsim prints for shells: bash runs its own, the others are compared with
// --help.
#include <set>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/simulator/tool/ToolFixture.h"

namespace {

using support::Finished;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::IsSupersetOf;

/// A `HelpedCommand` is a command as its --help lists it.
struct HelpedCommand {
    std::string path; ///< such as "line list"; empty for the program
    std::set<std::string> options;
    std::vector<std::string> commands;
};

class KvlsimCompletionTest : public ToolTest {
  protected:
    /// What bash offers for the last of `words` when Tab is pressed; "(file)" for file names.
    std::vector<std::string> complete(std::vector<std::string> const& words) const {
        std::string const script = write("kvlsim.bash", succeed({"completion", "bash"}));
        std::vector<std::string> command = {"/usr/bin/env", "bash", "--norc", "-c", R"(
            source "$0" || exit
            [[ $(complete -p kvlsim) == 'complete -F _kvlsim kvlsim' ]] || exit
            compopt() { [[ "$*" == '-o default' ]] && echo '(file)'; }
            COMP_WORDS=(kvlsim "$@") COMP_CWORD=$#
            _kvlsim kvlsim "${!#}" "${COMP_WORDS[COMP_CWORD-1]}"
            [[ ${#COMPREPLY[@]} -eq 0 ]] || printf '%s\n' "${COMPREPLY[@]}")", script};
        command.insert(command.end(), words.begin(), words.end());
        Finished const finished = support::run(command);
        EXPECT_EQ(finished.status, 0);
        EXPECT_EQ(finished.err, "");
        std::istringstream lines(finished.out);
        std::vector<std::string> offered;
        for (std::string line; std::getline(lines, line);)
            offered.push_back(line);
        return offered;
    }

    /// The program and its commands, as --help lists them, at any depth.
    std::vector<HelpedCommand> helpedCommands() const {
        std::vector<HelpedCommand> all;
        addHelped({}, "", all);
        return all;
    }

    bool installed(std::string const& shell) const {
        return support::run({"/bin/sh", "-c", "command -v " + shell}).status == 0;
    }

  private:
    void addHelped(std::vector<std::string> words, std::string const& path,
                   std::vector<HelpedCommand>& all) const {
        HelpedCommand command{path, {}, {}};
        words.push_back("--help");
        std::istringstream lines(succeed(words));
        words.pop_back();
        bool listsCommands = false;
        for (std::string line; std::getline(lines, line);) {
            if (!line.starts_with(' ')) listsCommands = line == "Subcommands:";
            std::istringstream parts(line);
            std::string first;
            parts >> first;
            if (listsCommands && line.starts_with("  ") && line[2] != ' ')
                command.commands.push_back(first);
            else if (auto const dashes = first.find("--"); dashes != std::string::npos)
                command.options.insert(first.substr(dashes));
        }
        all.push_back(command);
        for (auto const& name : command.commands) {
            words.push_back(name);
            addHelped(words, path.empty() ? name : path + " " + name, all);
            words.pop_back();
        }
    }
};

TEST_F(KvlsimCompletionTest, HelpIsReadAsItStands) {
    auto const commands = helpedCommands();
    ASSERT_GT(commands.size(), 35U);
    EXPECT_THAT(commands.front().options, IsSupersetOf({"--help", "--version", "--socket"}));
    EXPECT_THAT(commands.front().commands, IsSupersetOf({"insert", "line", "completion"}));
}

TEST_F(KvlsimCompletionTest, BashCompletesCommands) {
    EXPECT_THAT(complete({"li"}), ElementsAre("line"));
    EXPECT_THAT(complete({"line", "al"}), ElementsAre("alarm"));
    EXPECT_THAT(complete({"call", "s"}), ElementsAre("setup", "signalling", "script"));
    EXPECT_THAT(complete({"completion", ""}), ElementsAre("bash", "zsh", "fish"));
    EXPECT_THAT(complete({"nothing-of-that-name"}), IsEmpty());
}

TEST_F(KvlsimCompletionTest, BashCompletesOptions) {
    EXPECT_THAT(complete({"remove", "--no"}), ElementsAre("--no-wait"));
    EXPECT_THAT(complete({"set", "1", "IRQ", "5", "--sh"}), ElementsAre("--short"));
    EXPECT_THAT(complete({"line", "list", "--so"}), ElementsAre("--socket"));
    EXPECT_THAT(complete({"line", "list", "--v"}), IsEmpty());
    EXPECT_THAT(complete({"--ver"}), ElementsAre("--version"));
}

TEST_F(KvlsimCompletionTest, BashTakesAnOptionsValueForNoCommand) {
    EXPECT_THAT(complete({"--socket", "line", "li"}), ElementsAre("line"));
    EXPECT_THAT(complete({"--socket", "=", "line", "li"}), ElementsAre("line"));
    EXPECT_THAT(complete({"line", "--timeout", "5", "li"}), ElementsAre("list"));
    EXPECT_THAT(complete({"--timeout", "li"}), IsEmpty());
}

TEST_F(KvlsimCompletionTest, BashCompletesFileNamesWhereAFileIsMeant) {
    EXPECT_THAT(complete({"--socket", ""}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"--socket", "="}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"check", "big"}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"insert", ""}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"call", "script", ""}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"generate", "--output", ""}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"remove", ""}), IsEmpty());
}

TEST_F(KvlsimCompletionTest, BashKnowsEveryCommandAndOption) {
    for (auto const& command : helpedCommands()) {
        SCOPED_TRACE(command.path);
        std::istringstream path(command.path);
        std::vector<std::string> words;
        for (std::string word; path >> word;)
            words.push_back(word);
        words.push_back("--");
        EXPECT_THAT(complete(words), IsSupersetOf(command.options));
        words.back() = "";
        if (!command.commands.empty()) {
            EXPECT_THAT(complete(words), testing::ElementsAreArray(command.commands));
        }
    }
}

TEST_F(KvlsimCompletionTest, ZshsScriptHasEveryCommandAndOption) {
    std::string const script = succeed({"completion", "zsh"});
    EXPECT_THAT(script, testing::StartsWith("#compdef kvlsim\n"));
    for (auto const& command : helpedCommands()) {
        // What is offered for a command stands between its own case and the end of that case.
        auto const begin = script.find("        '" + command.path + "')\n            subcommands=");
        ASSERT_NE(begin, std::string::npos) << command.path;
        std::string const offered = script.substr(begin, script.find(";;", begin) - begin);
        for (auto const& name : command.commands)
            EXPECT_THAT(offered, HasSubstr("\n                '" + name + ":")) << command.path;
        for (auto const& option : command.options)
            EXPECT_THAT(offered, testing::ContainsRegex("\n                '" + option + "[:']"))
                << command.path;
    }
    if (installed("zsh")) {
        EXPECT_EQ(support::run({"/usr/bin/env", "zsh", "-n", write("_kvlsim", script)}).status, 0);
    }
}

TEST_F(KvlsimCompletionTest, FishsScriptHasEveryCommandAndOption) {
    std::string const script = succeed({"completion", "fish"});
    for (auto const& command : helpedCommands()) {
        std::string const here = "\ncomplete -c kvlsim -n '__kvlsim_at" +
                                 (command.path.empty() ? "" : " " + command.path) + "' ";
        for (auto const& name : command.commands)
            EXPECT_THAT(script, HasSubstr(here + "-a " + name + " -d '"));
        for (auto const& option : command.options) {
            std::string const word = "-l " + option.substr(2) + " ";
            EXPECT_TRUE(script.find(here + word) != std::string::npos ||
                        script.find(here + "-s h " + word) != std::string::npos)
                << command.path << ' ' << option;
        }
    }
    if (installed("fish")) {
        EXPECT_EQ(support::run({"/usr/bin/env", "fish", "-n", write("kvlsim.fish", script)}).status,
                  0);
    }
}

TEST_F(KvlsimCompletionTest, ScriptsThatTheBuildInstallsAreOfThisTool) {
    for (std::string const shell : {"bash", "zsh", "fish"}) {
        std::ostringstream built;
        built << std::ifstream(KVLSIM_COMPLETIONS "/kvlsim." + shell).rdbuf();
        EXPECT_EQ(built.str(), succeed({"completion", shell})) << shell;
    }
}

TEST_F(KvlsimCompletionTest, UnknownShellIsRefused) {
    expectRefusal({"completion", "fihs"}, 2, "did you mean \"completion fish\"?");
    expectRefusal({"completion"}, 2, "kvlsim: ");
}

} // namespace
