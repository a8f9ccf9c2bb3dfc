// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notifier.h"

#include <algorithm>
#include <numeric>

#include <gmock/gmock.h>

namespace kvloamd {
namespace {

using ::testing::SizeIs;

/// A sink that is ready when the test says so.
class ScriptedSink final : public NotificationSink {
  public:
    bool ready() const override { return isReady; }
    void send(Notification const& notification, Delivered taken) override {
        sent.push_back(notification.name.back());
        objects = notification.objects.size();
        if (takesAtOnce)
            taken(Delivery::Sent);
        else
            isReady = false;
        underWay = std::move(taken);
    }

    bool isReady = true;
    bool takesAtOnce = true;
    Delivered underWay;
    std::vector<std::uint32_t> sent;
    std::size_t objects = 0; ///< of the last one
};

class NotifierTest : public ::testing::Test {
  protected:
    void change(std::uint32_t number) { m_queue.push({{1, 3, number}, {}, Clock::now()}); }
    std::optional<Clock::time_point> announceShown() { return m_notifier.send(Clock::now()); }

    Counters m_counters;
    NotificationQueue m_queue{m_counters};
    ScriptedSink m_sink;
    int m_completed = 0;
    Notifier m_notifier{m_queue, m_sink, [this](Notification& notification) {
                            ++m_completed;
                            notification.objects.push_back({{1, 7}, ValueType::Integer, 7});
                        }};
};

TEST_F(NotifierTest, ChangesThatTheSnapshotShowsAreSentInOrder) {
    change(1);
    change(2);
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1, 2}));
    EXPECT_EQ(m_queue.size(), 0U);
}

TEST_F(NotifierTest, BurstIsSentInBatchesInItsOrder) {
    std::vector<std::uint32_t> all(2 * Notifier::kBatch + 1);
    std::iota(all.begin(), all.end(), 1);
    std::ranges::for_each(all, [this](std::uint32_t number) { change(number); });
    for (std::size_t batches = 1; batches <= 2; ++batches) {
        auto const again = announceShown();
        EXPECT_THAT(m_sink.sent, SizeIs(batches * Notifier::kBatch));
        ASSERT_TRUE(again.has_value());
        EXPECT_LE(*again, Clock::now()) << "the next batch waits for nothing";
    }
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_EQ(m_sink.sent, all);
}

TEST_F(NotifierTest, BatchThatLeavesNothingIsTheLast) {
    for (std::uint32_t number = 1; number <= Notifier::kBatch; ++number)
        change(number);
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_EQ(m_queue.size(), 0U);
}

TEST_F(NotifierTest, LastWordsAreNoBatches) {
    for (std::uint32_t number = 1; number <= 3 * Notifier::kBatch; ++number)
        change(number);
    EXPECT_TRUE(m_notifier.sendAll());
    EXPECT_THAT(m_sink.sent, SizeIs(3 * Notifier::kBatch));
}

TEST_F(NotifierTest, ChangeThatTheSnapshotDoesNotShowWaits) {
    auto const before = Clock::now() - std::chrono::milliseconds(1);
    change(1);
    auto const again = m_notifier.send(before);
    ASSERT_TRUE(again.has_value());
    EXPECT_GE(*again, before + Notifier::kPatience);
    EXPECT_TRUE(m_sink.sent.empty());
}

TEST_F(NotifierTest, NotificationThatIsSentAgainIsTheSameAndCompletedOnce) {
    m_sink.takesAtOnce = false;
    change(1);
    announceShown();
    EXPECT_EQ(m_sink.objects, 1U);
    // The connection was lost, so it is sent again.
    m_sink.isReady = true;
    announceShown();
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1, 1}));
    EXPECT_EQ(m_sink.objects, 1U);
    EXPECT_EQ(m_completed, 1);
    // The next one is another.
    m_sink.underWay(Delivery::Sent);
    m_sink.isReady = true;
    change(2);
    announceShown();
    EXPECT_EQ(m_completed, 2);
}

TEST_F(NotifierTest, ChangeStaysUntilItIsTaken) {
    m_sink.takesAtOnce = false;
    change(1);
    change(2);
    announceShown();
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1}));
    EXPECT_EQ(m_queue.size(), 2U);
    m_sink.underWay(Delivery::Sent);
    EXPECT_EQ(m_queue.size(), 1U);
    m_sink.isReady = true;
    announceShown();
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1, 2}));
}

TEST_F(NotifierTest, ChangeThatWasLostOnItsWayIsSentAgain) {
    m_sink.takesAtOnce = false;
    change(1);
    announceShown();
    m_sink.isReady = true;
    announceShown();
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1, 1}));
    EXPECT_EQ(m_queue.size(), 1U);
}

TEST_F(NotifierTest, ChangeThatIsGivenUpCountsAsDropped) {
    m_sink.takesAtOnce = false;
    change(1);
    announceShown();
    m_sink.underWay(Delivery::Dropped);
    EXPECT_EQ(m_queue.size(), 0U);
    EXPECT_EQ(m_counters.notificationsSent, 0U);
    EXPECT_EQ(m_counters.notificationsDropped, 1U);
}

TEST_F(NotifierTest, NothingIsSentWhileTheSinkIsNotReady) {
    m_sink.isReady = false;
    change(1);
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_FALSE(m_notifier.sendAll());
    EXPECT_TRUE(m_sink.sent.empty());
    EXPECT_EQ(m_queue.size(), 1U);
}

TEST_F(NotifierTest, LastWordsWaitForNoSnapshot) {
    auto const before = Clock::now();
    change(1);
    m_notifier.send(before);
    EXPECT_TRUE(m_notifier.sendAll());
    EXPECT_EQ(m_sink.sent, (std::vector<std::uint32_t>{1}));
}

TEST_F(NotifierTest, LastWordsThatAreNotTakenAreLeft) {
    m_sink.takesAtOnce = false;
    change(1);
    EXPECT_FALSE(m_notifier.sendAll());
    EXPECT_EQ(m_queue.size(), 1U);
}

TEST_F(NotifierTest, NotificationThatIsAwaitedCountsWhenItsFateIsKnown) {
    m_sink.takesAtOnce = false;
    std::vector<Delivered> awaited;
    for (std::uint32_t number = 1; number <= 2; ++number) {
        change(number);
        m_sink.isReady = true;
        announceShown();
        m_sink.underWay(Delivery::Awaited);
        awaited.push_back(m_sink.underWay);
    }
    EXPECT_EQ(m_queue.size(), 0U) << "others do not wait for it";
    EXPECT_EQ(m_counters.notificationsSent, 0U);
    awaited[1](Delivery::Unacknowledged);
    awaited[0](Delivery::Acknowledged);
    EXPECT_EQ(m_counters.notificationsSent, 1U);
    EXPECT_EQ(m_counters.notificationsUnacknowledged, 1U);
    EXPECT_EQ(m_counters.notificationsDropped, 0U);
}

} // namespace
} // namespace kvloamd
