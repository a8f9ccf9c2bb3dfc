// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/Log.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <csignal>
#include <string>

#include <gmock/gmock.h>

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

} // namespace
} // namespace kvloamd
