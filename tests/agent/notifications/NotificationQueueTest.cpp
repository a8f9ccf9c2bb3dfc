// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/NotificationQueue.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

class NotificationQueueTest : public ::testing::Test {
  protected:
    void push(std::uint32_t number) { m_queue.push({{1, 3, number}, {}, Clock::now()}); }
    std::uint32_t pop() { return m_queue.pop().value().name.back(); }

    Counters m_counters;
    NotificationQueue m_queue{m_counters, 2};
};

TEST_F(NotificationQueueTest, NotificationsComeOutInTheirOrder) {
    push(1);
    push(2);
    EXPECT_EQ(pop(), 1U);
    EXPECT_EQ(pop(), 2U);
}

TEST_F(NotificationQueueTest, EmptyQueueHasNothing) {
    EXPECT_FALSE(m_queue.pop().has_value());
    EXPECT_FALSE(m_queue.oldest().has_value());
}

TEST_F(NotificationQueueTest, NotificationThatFindsTheQueueFullIsDroppedAndCounted) {
    for (std::uint32_t number = 1; number <= 5; ++number)
        push(number);
    EXPECT_EQ(m_counters.notificationsDropped, 3U);
    EXPECT_EQ(pop(), 1U);
    EXPECT_EQ(pop(), 2U);
    EXPECT_FALSE(m_queue.pop().has_value());
}

TEST_F(NotificationQueueTest, QueueTakesNotificationsAgainOnceItHasRoom) {
    for (std::uint32_t number = 1; number <= 3; ++number)
        push(number);
    pop();
    push(4);
    EXPECT_EQ(pop(), 2U);
    EXPECT_EQ(pop(), 4U);
    EXPECT_EQ(m_counters.notificationsDropped, 1U);
}

TEST_F(NotificationQueueTest, ThoseThatWaitAndThoseThatHaveLeftAreCounted) {
    for (std::uint32_t number = 1; number <= 3; ++number)
        push(number);
    EXPECT_EQ(m_counters.notificationsWaiting, 2U);
    EXPECT_EQ(m_counters.notificationsSent, 0U);
    pop();
    EXPECT_EQ(m_counters.notificationsWaiting, 1U);
    EXPECT_EQ(m_counters.notificationsSent, 1U);
}

TEST_F(NotificationQueueTest, DroppedNotificationIsReported) {
    std::vector<std::uint32_t> dropped;
    m_queue.observeDrops(
        [&](Notification const& notification) { dropped.push_back(notification.name.back()); });
    for (std::uint32_t number = 1; number <= 4; ++number)
        push(number);
    EXPECT_EQ(dropped, (std::vector<std::uint32_t>{3, 4}));
}

} // namespace
} // namespace kvloamd
