// SPDX-License-Identifier: BSD-2-Clause
#include "agent/fronts/snmp/NameResolver.h"

#include <poll.h>
#include <sys/socket.h>

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class NameResolverTest : public ::testing::Test {
  protected:
    /// The next answer; of question 0 when none comes.
    NameResolver::Answer next() {
        constexpr int patience = 60000; // milliseconds
        pollfd polled{m_resolver.descriptor(), POLLIN, 0};
        poll(&polled, 1, patience);
        auto answers = m_resolver.take();
        EXPECT_EQ(answers.size(), 1U);
        return answers.empty() ? NameResolver::Answer{} : answers.front();
    }

    NameResolver m_resolver;
};

TEST_F(NameResolverTest, NameOfThisHostHasANumber) {
    std::uint64_t const question = m_resolver.ask("localhost", AF_INET);
    NameResolver::Answer const answer = next();
    EXPECT_EQ(answer.question, question);
    EXPECT_EQ(answer.number, "127.0.0.1");
}

TEST_F(NameResolverTest, NameThatDoesNotResolveSaysWhy) {
    m_resolver.ask("no such name", AF_INET);
    NameResolver::Answer const answer = next();
    EXPECT_EQ(answer.number, std::nullopt);
    EXPECT_NE(answer.fault, "");
}

TEST_F(NameResolverTest, EveryQuestionIsAnswered) {
    std::uint64_t const first = m_resolver.ask("127.0.0.1", AF_INET);
    EXPECT_EQ(next().question, first);
    std::uint64_t const second = m_resolver.ask("127.0.0.2", AF_INET);
    EXPECT_NE(second, first);
    NameResolver::Answer const answer = next();
    EXPECT_EQ(answer.question, second);
    EXPECT_EQ(answer.number, "127.0.0.2");
}

TEST(NameResolverEndTest, ResolverEndsWithUnansweredQuestions) {
    for (int round = 0; round < 20; ++round) {
        NameResolver resolver;
        for (int question = 0; question < 10; ++question)
            resolver.ask("127.0.0.1", AF_INET);
        resolver.dropQuestions();
    }
}

} // namespace
} // namespace kvloamd
