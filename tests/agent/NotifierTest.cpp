// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Notifier.h"

#include <gtest/gtest.h>

namespace kvloamd {
namespace {

/// Takes notifications when the test says so.
class ScriptedSink final : public NotificationSink {
  public:
    bool ready() const override { return isReady; }
    void send(Notification const& notification, std::function<void()> taken) override {
        names.push_back(notification.name);
        boards.push_back(std::get<std::int64_t>(notification.variables.at(0).value));
        serials.emplace_back(std::get<std::string_view>(notification.variables.at(1).value));
        if (takesAtOnce)
            taken();
        else
            isReady = false;
        underWay = std::move(taken);
    }

    bool isReady = true;
    bool takesAtOnce = true;
    std::function<void()> underWay;
    std::vector<Oid> names;
    std::vector<std::int64_t> boards;
    std::vector<std::string> serials;
};

class NotifierTest : public ::testing::Test {
  protected:
    void change(int board) { m_queue.push({board, "S" + std::to_string(board), 3, Clock::now()}); }
    std::optional<Clock::time_point> announceShown() { return m_notifier.announce(Clock::now()); }

    Counters m_counters;
    StatusQueue m_queue{m_counters};
    ScriptedSink m_sink;
    Notifier m_notifier{m_queue, m_sink, {1, 3, 9}};
};

TEST_F(NotifierTest, ChangesThatTheSnapshotShowsAreSentInOrder) {
    change(1);
    change(2);
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_EQ(m_sink.boards, (std::vector<std::int64_t>{1, 2}));
    EXPECT_EQ(m_sink.serials, (std::vector<std::string>{"S1", "S2"}));
    EXPECT_EQ(m_sink.names.front(), (Oid{1, 3, 9, 1, 0, 1}));
    EXPECT_EQ(m_queue.size(), 0U);
}

TEST_F(NotifierTest, ChangeThatTheSnapshotDoesNotShowWaits) {
    auto const before = Clock::now() - std::chrono::milliseconds(1);
    change(1);
    auto const again = m_notifier.announce(before);
    ASSERT_TRUE(again.has_value());
    EXPECT_GE(*again, before + Notifier::kPatience);
    EXPECT_TRUE(m_sink.boards.empty());
}

TEST_F(NotifierTest, ChangeStaysUntilItIsTaken) {
    m_sink.takesAtOnce = false;
    change(1);
    change(2);
    announceShown();
    EXPECT_EQ(m_sink.boards, (std::vector<std::int64_t>{1}));
    EXPECT_EQ(m_queue.size(), 2U);
    m_sink.underWay();
    EXPECT_EQ(m_queue.size(), 1U);
    m_sink.isReady = true;
    announceShown();
    EXPECT_EQ(m_sink.boards, (std::vector<std::int64_t>{1, 2}));
}

TEST_F(NotifierTest, ChangeThatWasLostOnItsWayIsSentAgain) {
    m_sink.takesAtOnce = false;
    change(1);
    announceShown();
    m_sink.isReady = true;
    announceShown();
    EXPECT_EQ(m_sink.boards, (std::vector<std::int64_t>{1, 1}));
    EXPECT_EQ(m_queue.size(), 1U);
}

TEST_F(NotifierTest, NothingIsSentWhileTheSinkIsNotReady) {
    m_sink.isReady = false;
    change(1);
    EXPECT_EQ(announceShown(), std::nullopt);
    EXPECT_FALSE(m_notifier.announceAll());
    EXPECT_TRUE(m_sink.boards.empty());
    EXPECT_EQ(m_queue.size(), 1U);
}

TEST_F(NotifierTest, LastWordsWaitForNoSnapshot) {
    auto const before = Clock::now();
    change(1);
    m_notifier.announce(before);
    EXPECT_TRUE(m_notifier.announceAll());
    EXPECT_EQ(m_sink.boards, (std::vector<std::int64_t>{1}));
}

TEST_F(NotifierTest, LastWordsThatAreNotTakenAreLeft) {
    m_sink.takesAtOnce = false;
    change(1);
    EXPECT_FALSE(m_notifier.announceAll());
    EXPECT_EQ(m_queue.size(), 1U);
}

} // namespace
} // namespace kvloamd
