// SPDX-License-Identifier: BSD-2-Clause
#include "agent/log/RepeatFilter.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class RepeatFilterTest : public ::testing::Test {
  protected:
    bool passes(std::string const& text) { return m_filter.passes(text, m_now); }

    RepeatFilter m_filter;
    RepeatFilter::Clock::time_point m_now = RepeatFilter::Clock::now();
};

TEST_F(RepeatFilterTest, TextPassesOnceInItsPause) {
    EXPECT_TRUE(passes("a"));
    EXPECT_FALSE(passes("a"));
}

TEST_F(RepeatFilterTest, OtherTextsPass) {
    EXPECT_TRUE(passes("a"));
    EXPECT_TRUE(passes("b"));
}

TEST_F(RepeatFilterTest, TextPassesAgainAfterItsPause) {
    EXPECT_TRUE(passes("a"));
    m_now += RepeatFilter::kPause;
    EXPECT_TRUE(passes("a"));
}

TEST_F(RepeatFilterTest, FloodOfDifferentTextsIsBounded) {
    std::size_t passed = 0;
    for (int text = 0; text < 1000; ++text)
        if (passes("Unknown user name: " + std::to_string(text))) ++passed;
    EXPECT_EQ(passed, RepeatFilter::kPerKind);
}

TEST_F(RepeatFilterTest, FloodDoesNotSuppressANewKindOfTrouble) {
    for (int text = 0; text < 1000; ++text)
        passes("Authentication failed for user" + std::to_string(text));
    EXPECT_TRUE(passes("the disk is full"));
}

TEST_F(RepeatFilterTest, FloodOfKindsDoesNotSuppressANewOne) {
    for (char first = 'a'; first <= 'z'; ++first)
        for (char second = 'a'; second <= 'z'; ++second)
            passes({first, second});
    EXPECT_TRUE(passes("the disk is full"));
}

} // namespace
} // namespace kvloamd
