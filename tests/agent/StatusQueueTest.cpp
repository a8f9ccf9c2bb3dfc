// SPDX-License-Identifier: BSD-2-Clause
#include "agent/StatusQueue.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class StatusQueueTest : public ::testing::Test {
  protected:
    void push(int boardIndex) { m_queue.push({boardIndex, "S", 3, Clock::now()}); }
    int pop() { return m_queue.pop().value().boardIndex; }

    Counters m_counters;
    StatusQueue m_queue{m_counters, 2};
};

TEST_F(StatusQueueTest, ChangesComeOutInTheirOrder) {
    push(1);
    push(2);
    EXPECT_EQ(pop(), 1);
    EXPECT_EQ(pop(), 2);
}

TEST_F(StatusQueueTest, EmptyQueueHasNothing) {
    EXPECT_FALSE(m_queue.pop().has_value());
    EXPECT_FALSE(m_queue.oldest().has_value());
}

TEST_F(StatusQueueTest, ChangeThatFindsTheQueueFullIsDroppedAndCounted) {
    for (int index = 1; index <= 5; ++index)
        push(index);
    EXPECT_EQ(m_counters.notificationsDropped, 3U);
    EXPECT_EQ(m_counters.statusChanges, 5U);
    EXPECT_EQ(pop(), 1);
    EXPECT_EQ(pop(), 2);
    EXPECT_FALSE(m_queue.pop().has_value());
}

TEST_F(StatusQueueTest, QueueTakesChangesAgainOnceItHasRoom) {
    for (int index = 1; index <= 3; ++index)
        push(index);
    pop();
    push(4);
    EXPECT_EQ(pop(), 2);
    EXPECT_EQ(pop(), 4);
    EXPECT_EQ(m_counters.notificationsDropped, 1U);
}

} // namespace
} // namespace kvloamd
