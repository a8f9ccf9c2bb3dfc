// SPDX-License-Identifier: BSD-2-Clause
// The scripts that kvloam prints for shells: bash runs its own against an agent, the others are
// read.
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/cli/FakeAgent.h"
#include "tests/cli/Samples.h"
#include "tests/support/ChildProcess.h"
#include "tests/support/TemporaryDirectory.h"

namespace {

using support::Finished;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

class KvloamCompletionTest : public testing::Test {
  protected:
    std::string script(std::string const& shell) const {
        Finished const finished = support::run({KVLOAM_TOOL, "completion", shell});
        EXPECT_EQ(finished.status, 0) << finished.err;
        return finished.out;
    }
    std::string write(char const* name, std::string const& text) const {
        std::ofstream(m_directory.file(name)) << text;
        return m_directory.file(name);
    }
    /// What bash offers for the last of `words` when Tab is pressed.
    std::vector<std::string> complete(std::vector<std::string> const& words) const {
        std::vector<std::string> command = {"/usr/bin/env",
                                            "bash",
                                            "--norc",
                                            "-c",
                                            R"(
            PATH=$TOOL_DIR:$PATH
            source "$0" || exit
            compopt() { [[ "$*" == '-o default' ]] && echo '(file)'; }
            COMP_WORDS=(kvloam "$@") COMP_CWORD=$#
            _kvloam kvloam "${!#}" "${COMP_WORDS[COMP_CWORD-1]}"
            [[ ${#COMPREPLY[@]} -eq 0 ]] || printf '%s\n' "${COMPREPLY[@]}")",
                                            write("kvloam.bash", script("bash"))};
        command.insert(command.end(), words.begin(), words.end());
        Finished const finished = support::run(
            command, {"KVLOAM_SOCKET=" + m_directory.file("socket"), "TOOL_DIR=" KVLOAM_TOOL_DIR});
        EXPECT_EQ(finished.status, 0);
        EXPECT_EQ(finished.err, "");
        std::istringstream lines(finished.out);
        std::vector<std::string> offered;
        for (std::string line; std::getline(lines, line);)
            offered.push_back(line);
        return offered;
    }
    bool installed(std::string const& shell) const {
        return support::run({"/bin/sh", "-c", "command -v " + shell}).status == 0;
    }

    support::TemporaryDirectory m_directory;
};

TEST_F(KvloamCompletionTest, BashCompletesCommandsAndOptions) {
    EXPECT_THAT(complete({"bo"}), ElementsAre("boards", "board"));
    EXPECT_THAT(complete({"jo"}), ElementsAre("journal"));
    EXPECT_THAT(complete({"journal", "--fo"}), ElementsAre("--follow"));
    EXPECT_THAT(complete({"lines", "--so"}), ElementsAre("--socket"));
    EXPECT_THAT(complete({"--socket", ""}), ElementsAre("(file)"));
    EXPECT_THAT(complete({"boards", ""}), IsEmpty());
    // It is for the scripts.
    EXPECT_THAT(complete({"nam"}), IsEmpty());
}

TEST_F(KvloamCompletionTest, BashOffersTheAgentsNames) {
    FakeAgent agent(m_directory.file("socket"), {{"boards", samples::kBoards},
                                                 {"lines", samples::kLines},
                                                 {"tables", R"({"tables":["ifTable"]})"}});
    EXPECT_THAT(complete({"--timeout", "60", "board", ""}), ElementsAre("NX50001", "Z70002"));
    EXPECT_THAT(complete({"board", "--timeout", "60", "NX"}), ElementsAre("NX50001"));
    EXPECT_THAT(complete({"--timeout", "60", "line", "nx5-trunk-2"}), ElementsAre("nx5-trunk-2"));
    EXPECT_THAT(complete({"--timeout", "60", "history", "--openmetrics", "nx5-trunk-1", "nx"}),
                ElementsAre("nx5-trunk-1", "nx5-trunk-2"));
    EXPECT_THAT(complete({"--timeout", "60", "table", "if"}), ElementsAre("ifTable"));
}

TEST_F(KvloamCompletionTest, BashAsksTheAgentThatTheCommandLineNames) {
    FakeAgent agent;
    agent.answerApi("boards", samples::kBoards);
    EXPECT_THAT(complete({"--timeout", "60", "--host", agent.host(), "board", "Z"}),
                ElementsAre("Z70002"));
    // bash makes words of "=" and ":".
    std::string const host = agent.host();
    std::size_t const colon = host.find(':');
    EXPECT_THAT(complete({"board", "--timeout", "60", "--host", "=", host.substr(0, colon), ":",
                          host.substr(colon + 1), "Z"}),
                ElementsAre("Z70002"));
}

TEST_F(KvloamCompletionTest, WithoutAnAgentBashOffersNothing) {
    EXPECT_THAT(complete({"board", ""}), IsEmpty());
}

TEST_F(KvloamCompletionTest, ZshAndFishAskForNamesToo) {
    std::string const zsh = script("zsh");
    EXPECT_THAT(zsh, testing::StartsWith("#compdef kvloam\n"));
    EXPECT_THAT(zsh, HasSubstr("            names=board\n"));
    EXPECT_THAT(zsh, HasSubstr("$(kvloam \"${given[@]}\" names \"$names\" 2>/dev/null)"));
    std::string const fish = script("fish");
    EXPECT_THAT(fish,
                HasSubstr("complete -c kvloam -n '__kvloam_at line' -a '(__kvloam_names line)'"));
    EXPECT_THAT(fish, HasSubstr("kvloam $given names $argv 2>/dev/null"));
    if (installed("zsh")) {
        EXPECT_EQ(support::run({"/usr/bin/env", "zsh", "-n", write("_kvloam", zsh)}).status, 0);
    }
    if (installed("fish")) {
        EXPECT_EQ(support::run({"/usr/bin/env", "fish", "-n", write("kvloam.fish", fish)}).status,
                  0);
    }
}

TEST_F(KvloamCompletionTest, ScriptsThatTheBuildInstallsAreOfThisTool) {
    for (std::string const shell : {"bash", "zsh", "fish"}) {
        std::ostringstream built;
        built << std::ifstream(KVLOAM_COMPLETIONS "/kvloam." + shell).rdbuf();
        EXPECT_EQ(built.str(), script(shell)) << shell;
    }
}

} // namespace
