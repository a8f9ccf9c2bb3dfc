// SPDX-License-Identifier: BSD-2-Clause
#include "core/Turns.h"

#include <gtest/gtest.h>

namespace {

using KVL::Turns;
using namespace std::chrono_literals;

TEST(TurnsTest, OneThreadAloneNeverStaysAway) {
    Turns turns;
    int thread = 0;
    for (int i = 0; i < 1000; ++i)
        EXPECT_FALSE(turns.note(&thread));
}

TEST(TurnsTest, ThreadsThatWorkInBurstsNeverStayAway) {
    Turns turns;
    int threads[2] = {};
    for (int i = 0; i < 1000; ++i) {
        EXPECT_FALSE(turns.note(&threads[i % 2]));
        EXPECT_FALSE(turns.note(&threads[i % 2]));
    }
}

TEST(TurnsTest, QuickStepsSendAThreadAway) {
    Turns turns;
    auto const start = Turns::Clock::now();
    turns.noteSteps(start);
    EXPECT_TRUE(turns.noteSteps(start + 5us));
    EXPECT_TRUE(turns.noteSteps(start + 10us));
}

TEST(TurnsTest, SlowStepsSendNoThreadAway) {
    Turns turns;
    auto const start = Turns::Clock::now();
    turns.noteSteps(start);
    EXPECT_FALSE(turns.noteSteps(start + 1ms));
    EXPECT_FALSE(turns.noteSteps(start + 2ms));
}

} // namespace
