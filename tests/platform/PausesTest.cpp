// SPDX-License-Identifier: BSD-2-Clause
// Waiting awake for a lock, and when not to.
#include <sched.h>

#include <cstddef>

#include <gtest/gtest.h>

#include "platform/Pauses.h"

namespace {

TEST(PausesTest, SingleProcessorIsNotWaitedOn) {
    EXPECT_EQ(KVL::longest_wait(1), 0);
}

TEST(PausesTest, SeveralProcessorsAreWaitedOn) {
    EXPECT_EQ(KVL::longest_wait(2), KVL::kLongestWait);
    EXPECT_EQ(KVL::longest_wait(64), KVL::kLongestWait);
}

TEST(PausesTest, ProcessMayUseAtLeastOneProcessor) {
    EXPECT_GE(KVL::usable_processors(), 1);
}

TEST(PausesTest, ProcessThatIsBoundToAProcessorMayUseOne) {
    cpu_set_t before;
    ASSERT_EQ(sched_getaffinity(0, sizeof before, &before), 0);
    std::size_t processor = 0;
    while (!CPU_ISSET(processor, &before))
        ++processor;
    cpu_set_t one;
    CPU_ZERO(&one);
    CPU_SET(processor, &one);
    ASSERT_EQ(sched_setaffinity(0, sizeof one, &one), 0);
    EXPECT_EQ(KVL::usable_processors(), 1);
    ASSERT_EQ(sched_setaffinity(0, sizeof before, &before), 0);
    EXPECT_EQ(KVL::usable_processors(), CPU_COUNT(&before));
}

} // namespace
