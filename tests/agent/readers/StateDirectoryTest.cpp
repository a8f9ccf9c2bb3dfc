// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/StateDirectory.h"

#include <sys/wait.h>

#include <gmock/gmock.h>

#include "tests/agent/readers/StateFolder.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::HasSubstr;
using ::testing::IsEmpty;

class StateDirectoryTest : public StateFolder {
  protected:
    std::string directory() const { return m_folder + "/state"; }
    static std::string refusal(std::string const& path) {
        try {
            StateDirectory const taken(path);
            return {};
        } catch (std::runtime_error const& error) {
            return error.what();
        }
    }
};

TEST_F(StateDirectoryTest, MissingDirectoryIsCreatedForItsOwnerOnly) {
    StateDirectory const taken(directory());
    struct stat status {};
    ASSERT_EQ(stat(directory().c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777, 0700U);
}

TEST_F(StateDirectoryTest, SecondAgentIsRefusedAndNamesTheFirst) {
    StateDirectory const taken(directory());
    EXPECT_THAT(refusal(directory()), HasSubstr("process " + std::to_string(getpid())));
}

TEST_F(StateDirectoryTest, DirectoryIsFreeAgainWhenTheFirstAgentHasStopped) {
    { StateDirectory const taken(directory()); }
    EXPECT_EQ(refusal(directory()), "");
}

TEST_F(StateDirectoryTest, DirectoryOfAnAgentThatWasKilledIsFree) {
    pid_t const child = fork();
    if (child == 0) {
        StateDirectory const taken(directory());
        kill(getpid(), SIGKILL);
        _exit(0);
    }
    int status = 0;
    ASSERT_EQ(waitpid(child, &status, 0), child);
    EXPECT_TRUE(WIFSIGNALED(status));
    EXPECT_EQ(refusal(directory()), "");
}

TEST_F(StateDirectoryTest, LinkIsRefused) {
    std::filesystem::create_directory(m_folder + "/elsewhere");
    std::filesystem::create_symlink("elsewhere", directory());
    EXPECT_THAT(refusal(directory()), HasSubstr("symbolic link"));
    EXPECT_THAT(refusal(directory() + "/"), HasSubstr("symbolic link"));
}

TEST_F(StateDirectoryTest, DanglingLinkInTheDirectoryIsRefused) {
    for (char const* const name : {"ifindex.sqlite", "entity.sqlite", "kvloamd.conf"}) {
        std::filesystem::create_directories(directory());
        std::filesystem::create_symlink(m_folder + "/nowhere", directory() + "/" + name);
        EXPECT_THAT(refusal(directory()), HasSubstr(std::string(name) + ": is not a regular file"));
        std::filesystem::remove_all(directory());
    }
}

TEST_F(StateDirectoryTest, DirectoryThatEveryUserCanWriteIsRefused) {
    std::filesystem::create_directory(directory());
    chmod(directory().c_str(), 01777);
    EXPECT_THAT(refusal(directory()), HasSubstr("every user can write"));
}

TEST_F(StateDirectoryTest, DirectoryOrFileOfAnotherUserIsRefused) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can give files away";
    constexpr uid_t kNobody = 65534;
    std::filesystem::create_directory(directory());
    { std::ofstream(directory() + "/kvloamd.conf") << "rocommunity planted\n"; }
    ASSERT_EQ(chown((directory() + "/kvloamd.conf").c_str(), kNobody, kNobody), 0);
    EXPECT_THAT(refusal(directory()), HasSubstr("kvloamd.conf: belongs to another user"));
    std::filesystem::remove(directory() + "/kvloamd.conf");
    ASSERT_EQ(chown(directory().c_str(), kNobody, kNobody), 0);
    EXPECT_THAT(refusal(directory()), HasSubstr("directory belongs to another user"));
}

TEST_F(StateDirectoryTest, DirectoryThatCannotBeWrittenIsLoggedOnly) {
    write("");
    LogCapture logged;
    EXPECT_EQ(refusal(file() + "/state"), "");
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(message, HasSubstr("--persistent-dir"));
}

TEST_F(StateDirectoryTest, NoDirectoryIsNoFault) {
    LogCapture logged;
    EXPECT_EQ(refusal(""), "");
    EXPECT_THAT(logged.take(), IsEmpty());
}

} // namespace
} // namespace kvloamd
