// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/Log.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <string>

#include <gmock/gmock.h>

#include "tests/support/TemporaryDirectory.h"

namespace kvloamd {
namespace {

using ::testing::StartsWith;

/// Standard error is a pipe while the test runs.
class LogTest : public ::testing::Test {
  protected:
    LogTest() : m_standardError(dup(STDERR_FILENO)) {
        std::signal(SIGPIPE, SIG_IGN);
        EXPECT_EQ(pipe2(m_ends, O_CLOEXEC), 0);
        dup2(m_ends[1], STDERR_FILENO);
    }
    ~LogTest() override {
        dup2(m_standardError, STDERR_FILENO);
        close(m_standardError);
        leave();
        close(m_ends[1]);
    }
    /// The reader leaves.
    void leave() {
        if (m_ends[0] >= 0) close(m_ends[0]);
        m_ends[0] = -1;
    }
    /// Reads what is in the pipe.
    std::string readAll() const {
        fcntl(m_ends[0], F_SETFL, O_NONBLOCK);
        std::string text;
        char buffer[4096];
        for (ssize_t got = 0; (got = read(m_ends[0], buffer, sizeof buffer)) > 0;)
            text.append(buffer, static_cast<std::size_t>(got));
        return text;
    }

    int m_standardError;
    int m_ends[2] = {-1, -1};
};

TEST_F(LogTest, TextBecomesOneLine) {
    log(LogLevel::Error, "first\nsecond");
    EXPECT_EQ(readAll(), "kvloamd: first second\n");
}

TEST_F(LogTest, FullPipeLosesLinesAndTheirNumberIsLogged) {
    constexpr int kLines = 3000;
    for (int i = 0; i < kLines; ++i)
        log(LogLevel::Error, "a line that nobody reads");
    std::string const text = readAll();
    auto const read = std::count(text.begin(), text.end(), '\n');
    ASSERT_LT(read, kLines);
    log(LogLevel::Error, "the next one");
    EXPECT_EQ(readAll(), "kvloamd: log lines lost, because the log took no more: " +
                             std::to_string(kLines - read) + "\nkvloamd: the next one\n");
}

TEST_F(LogTest, ReaderThatHasLeftEndsNothing) {
    leave();
    log(LogLevel::Error, "a line for nobody");
    log(LogLevel::Error, "another one");
}

TEST_F(LogTest, VeryLongTextIsCut) {
    log(LogLevel::Error, std::string(100000, 'x'));
    std::string const text = readAll();
    EXPECT_LE(text.size(), 4096U);
    EXPECT_THAT(text, StartsWith("kvloamd: xxx"));
    EXPECT_EQ(text.back(), '\n');
}

TEST_F(LogTest, FieldsAreNotPartOfTheLine) {
    log(LogLevel::Info, "text", {{"KVL_BOARD", "S1"}});
    EXPECT_EQ(readAll(), "kvloamd: text\n");
}

TEST_F(LogTest, StandardErrorIsTheJournalIfTheEnvironmentNamesItsStream) {
    EXPECT_FALSE(standardErrorIsJournal());
    struct stat status {};
    fstat(STDERR_FILENO, &status);
    std::string const stream = std::to_string(status.st_dev) + ":" + std::to_string(status.st_ino);
    setenv("JOURNAL_STREAM", stream.c_str(), 1);
    EXPECT_TRUE(standardErrorIsJournal());
    setenv("JOURNAL_STREAM", "1:1", 1);
    EXPECT_FALSE(standardErrorIsJournal());
    unsetenv("JOURNAL_STREAM");
}

/// The test listens where the journal would.
class JournalTest : public LogTest {
  protected:
    JournalTest() : m_socket(socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        std::string const path = m_folder.file("journal");
        std::memcpy(address.sun_path, path.c_str(), path.size() + 1);
        EXPECT_EQ(bind(m_socket, reinterpret_cast<sockaddr const*>(&address), sizeof address), 0);
        logToJournal(path);
    }
    ~JournalTest() override {
        if (m_socket >= 0) close(m_socket);
    }
    /// The next entry; empty if there is none.
    std::string entry() const {
        char buffer[8192];
        ssize_t const size = recv(m_socket, buffer, sizeof buffer, MSG_DONTWAIT);
        return {buffer, static_cast<std::size_t>(std::max<ssize_t>(size, 0))};
    }

    support::TemporaryDirectory m_folder;
    int m_socket;
};

TEST_F(JournalTest, EntryHasPriorityTextAndFields) {
    log(LogLevel::Warning, "alarm\nraised", {{"KVL_BOARD", "S\n1"}, {"KVL_LINE", ""}});
    EXPECT_EQ(entry(), "PRIORITY=4\nSYSLOG_IDENTIFIER=kvloamd\nMESSAGE=alarm raised\n"
                       "KVL_BOARD=S 1\n");
    EXPECT_EQ(readAll(), "");
}

TEST_F(JournalTest, FullJournalLosesEntriesAndTheirNumberIsLogged) {
    constexpr int kEntries = 5000;
    for (int i = 0; i < kEntries; ++i)
        log(LogLevel::Error, "an entry that nobody reads");
    int kept = 0;
    while (!entry().empty())
        ++kept;
    ASSERT_LT(kept, kEntries);
    log(LogLevel::Error, "next");
    EXPECT_THAT(entry(), ::testing::HasSubstr("because the log took no more: " +
                                              std::to_string(kEntries - kept) + "\n"));
    EXPECT_THAT(entry(), ::testing::HasSubstr("MESSAGE=next\n"));
}

TEST_F(JournalTest, LineGoesToStandardErrorWhenNobodyListens) {
    close(m_socket);
    m_socket = -1;
    log(LogLevel::Error, "text");
    EXPECT_EQ(readAll(), "kvloamd: text\n");
}

} // namespace
} // namespace kvloamd
