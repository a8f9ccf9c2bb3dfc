// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/StatusListener.h"

#include <thread>

#include <gtest/gtest.h>

#include "board/Board.h"
#include "tests/support/FakeBoards.h"

namespace kvloamd {
namespace {

class StatusListenerTest : public ::testing::Test {
  protected:
    StatusListenerTest() { m_chassis.manager->AddBoardStatusListener(&m_listener); }

    void start() {
        m_listener.start([this] { ++m_told; });
    }
    void announce(ReferenceCounter<Board> const& board, BoardStatusEnum status) {
        m_chassis.factoryHandle->NotifyBoardStatusListeners(board, status);
    }

    static std::string serialNumberOf(Notification const& change) {
        return std::get<std::string>(change.objects.at(1).value);
    }
    static std::int64_t statusOf(Notification const& change) {
        return std::get<std::int64_t>(change.objects.at(2).value);
    }

    FakeChassis m_chassis;
    Counters m_counters;
    BoardSource m_source{*m_chassis.manager.get()};
    NotificationQueue m_queue{m_counters};
    StatusListener m_listener{*m_chassis.manager.get(), m_source, m_queue, m_counters, {1, 3, 9}};
    int m_told = 0;
};

TEST_F(StatusListenerTest, ChangeIsQueuedWithIndexSerialNumberAndStatus) {
    start();
    m_chassis.insert("A");
    announce(m_chassis.insert("B"), BoardStatusStopped);
    auto const change = m_queue.pop();
    ASSERT_TRUE(change.has_value());
    EXPECT_EQ(change->name, (Oid{1, 3, 9, 1, 0, 1}));
    ASSERT_EQ(change->objects.size(), 3U);
    EXPECT_EQ(change->objects[0].name, (Oid{1, 3, 9, 1, 1, 3, 1, 0}));
    EXPECT_EQ(change->objects[0].view(), Value{std::int64_t{2}});
    EXPECT_EQ(serialNumberOf(*change), "B");
    EXPECT_EQ(statusOf(*change), BoardStatusStopped);
    EXPECT_EQ(m_told, 1);
}

TEST_F(StatusListenerTest, ChangeIsWhatItWasWhenTheBoardChangesAfterwards) {
    start();
    ReferenceCounter<Board> const board = m_chassis.insert("A");
    announce(board, BoardStatusRemoved);
    m_chassis.factory->takeOut(board);
    FakeChassis::fake(board).serialNumber = "B";
    EXPECT_EQ(serialNumberOf(m_queue.pop().value()), "A");
}

TEST_F(StatusListenerTest, BoardsThatAreFoundAtTheStartAreNoChanges) {
    announce(m_chassis.insert("A"), BoardStatusAdded);
    start();
    EXPECT_FALSE(m_queue.pop().has_value());
    EXPECT_EQ(m_counters.statusChanges, 0U);
}

TEST_F(StatusListenerTest, ChangeThatAnotherThreadTellsDuringTheStartIsOne) {
    ReferenceCounter<Board> const board = m_chassis.insert("A");
    std::thread([&] { announce(board, BoardStatusFailed); }).join();
    start();
    EXPECT_EQ(statusOf(m_queue.pop().value()), BoardStatusFailed);
}

TEST_F(StatusListenerTest, RemovedBoardIsOutOfTheSnapshotAtOnce) {
    start();
    announce(m_chassis.insert("A"), BoardStatusRemoved);
    EXPECT_TRUE(m_source.read().empty());
}

TEST_F(StatusListenerTest, WhatBecomesOfABoardOutOfTheTableIsNoNews) {
    start();
    ReferenceCounter<Board> const board = m_chassis.insert("A");
    m_chassis.factory->takeOut(board);
    announce(board, BoardStatusStopped);
    EXPECT_FALSE(m_queue.pop().has_value());
}

TEST_F(StatusListenerTest, NothingIsQueuedAfterTheStop) {
    start();
    m_listener.stop();
    announce(m_chassis.insert("A"), BoardStatusStarted);
    EXPECT_FALSE(m_queue.pop().has_value());
    EXPECT_EQ(m_told, 0);
}

} // namespace
} // namespace kvloamd
