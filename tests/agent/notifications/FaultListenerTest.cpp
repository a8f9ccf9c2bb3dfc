// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultListener.h"

#include <gtest/gtest.h>

#include "board/Board.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/SimulatedPlatform.h"

namespace kvloamd {
namespace {

class FaultListenerTest : public ::testing::Test {
  protected:
    FaultListenerTest() {
        m_chassis.manager->AddBoardStatusListener(&m_listener);
        m_listener.start([this] { ++m_told; });
    }

    /// Inserts and announces a board. -1: it has no logical identifier.
    ReferenceCounter<Board> insert(std::string serialNumber, int logicalId) {
        auto board = m_chassis.insert(std::move(serialNumber));
        FakeChassis::fake(board).number = logicalId;
        announce(board, BoardStatusAdded);
        return board;
    }
    void announce(ReferenceCounter<Board> const& board, BoardStatusEnum status) {
        m_chassis.factoryHandle->NotifyBoardStatusListeners(board, status);
    }
    void remove(ReferenceCounter<Board> const& board) {
        announce(board, BoardStatusRemoved);
        m_chassis.factory->takeOut(board);
    }
    void tell(FaultMessage message, int platformBoard, std::uint16_t fault) {
        m_listener.ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent>(
            new ExternalFaultEvent(message, platformBoard, fault)));
    }
    std::vector<FaultRow> rows() const { return m_faults.read(Clock::now()).rows; }
    /// The numbers in the next notification: board index, fault value, platform board number.
    std::vector<std::int64_t> numbersSent() {
        auto const notification = m_queue.pop();
        if (!notification) return {};
        std::vector<std::int64_t> numbers;
        for (NotifiedObject const& object : notification->objects)
            if (auto const* const number = std::get_if<std::int64_t>(&object.value))
                numbers.push_back(*number);
        return numbers;
    }

    FakeChassis m_chassis;
    Counters m_counters;
    FaultLog m_faults;
    NotificationQueue m_queue{m_counters};
    FaultListener m_listener{*m_chassis.manager.get(), m_faults, m_queue, {1, 3, 9}};
    int m_told = 0;
};

TEST_F(FaultListenerTest, FaultIsThatOfTheBoardWithTheLogicalIdentifier) {
    insert("A", 0);
    insert("B", 5);
    tell(FaultRaised, 5, 17);
    ASSERT_EQ(rows().size(), 1U);
    EXPECT_EQ(rows()[0].boardIndex, 2U);
    EXPECT_EQ(m_told, 1);
}

TEST_F(FaultListenerTest, RaisedFaultIsAnnouncedWithItsBoard) {
    insert("A", 0);
    tell(FaultRaised, 0, 17);
    auto const notification = m_queue.oldest();
    ASSERT_TRUE(notification.has_value());
    EXPECT_EQ(notification->name, (Oid{1, 3, 9, 1, 0, 2}));
    EXPECT_EQ(std::get<std::string>(notification->objects.at(1).value), "A");
    EXPECT_EQ(numbersSent(), (std::vector<std::int64_t>{1, 17, 0, 1}));
}

TEST_F(FaultListenerTest, ClearedFaultIsAnnouncedAndOutOfTheList) {
    insert("A", 3);
    tell(FaultRaised, 3, 17);
    m_queue.pop();
    tell(FaultCleared, 3, 17);
    EXPECT_TRUE(rows().empty());
    EXPECT_EQ(m_queue.oldest()->name, (Oid{1, 3, 9, 1, 0, 3}));
    EXPECT_EQ(numbersSent(), (std::vector<std::int64_t>{1, 17, 3, 1}));
}

TEST_F(FaultListenerTest, FaultOfNoBoardIsThatOfBoardZero) {
    insert("A", 3);
    tell(FaultRaised, 4, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 0U);
    EXPECT_EQ(numbersSent(), (std::vector<std::int64_t>{0, 17, 4, 1}));
}

TEST_F(FaultListenerTest, FaultsOfARemovedBoardAreGoneAtOnce) {
    auto const board = insert("A", 3);
    tell(FaultRaised, 3, 17);
    remove(board);
    EXPECT_TRUE(rows().empty());
    EXPECT_EQ(m_told, 2);
}

TEST_F(FaultListenerTest, FaultAfterAReplacementIsThatOfTheNewBoard) {
    auto const board = insert("A", 3);
    remove(board);
    insert("B", 3);
    tell(FaultRaised, 3, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 2U);
}

TEST_F(FaultListenerTest, FaultIsThatOfTheNewestBoardWithItsNumber) {
    insert("A", 3);
    insert("B", 3);
    tell(FaultRaised, 3, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 2U);
}

TEST_F(FaultListenerTest, LogicalIdentifierThatComesWithTheStartCounts) {
    auto const board = insert("A", -1);
    FakeChassis::fake(board).number = 6;
    announce(board, BoardStatusStarted);
    tell(FaultRaised, 6, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 1U);
}

TEST_F(FaultListenerTest, BoardsAreKnownInWhateverOrderTheyAreAnnounced) {
    std::vector<ReferenceCounter<Board>> boards;
    for (int number = 0; number < 5; ++number) {
        boards.push_back(m_chassis.insert("B" + std::to_string(number)));
        FakeChassis::fake(boards.back()).number = number;
    }
    for (std::size_t const place : {2U, 0U, 1U, 4U, 3U})
        announce(boards[place], BoardStatusAdded);
    remove(boards[4]);
    insert("new", 5);
    announce(boards[1], BoardStatusStarted);
    for (int const number : {0, 1, 2, 3, 5}) {
        tell(FaultRaised, number, 17);
        EXPECT_EQ(numbersSent().at(0), number + 1) << "board number " << number;
    }
}

TEST_F(FaultListenerTest, FaultThatIsToldBeforeItsBoardBecomesTheBoards) {
    tell(FaultRaised, 6, 17);
    insert("A", 6);
    EXPECT_EQ(rows().at(0).boardIndex, 1U);
}

TEST_F(FaultListenerTest, BoardWithoutLogicalIdentifierIsKnownByItsDrivers) {
    sim::load({sim::board(5, "S5", "VORN_DRIVER_BOARD_ID: 100"),
               sim::board(6, "S6", "VORN_DRIVER_BOARD_ID: 101")});
    insert("S5", -1);
    insert("S6", -1);
    tell(FaultRaised, 101, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 2U);
}

TEST_F(FaultListenerTest, DriversNumberIsNoNumberOfABoardThatHasALogicalIdentifier) {
    sim::load({sim::board(5, "S5", "VORN_DRIVER_BOARD_ID: 100"),
               sim::board(6, "S6", "VORN_DRIVER_BOARD_ID: 101")});
    insert("S5", -1);
    insert("S6", 1);
    tell(FaultRaised, 101, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 0U);
}

TEST_F(FaultListenerTest, DriversNumberOfSeveralBoardsIsThatOfNone) {
    sim::load({sim::board(5, "S5", "VORN_DRIVER_BOARD_ID: 100"),
               sim::board(6, "S6", "VORN_DRIVER_BOARD_ID: 100")});
    insert("S5", -1);
    insert("S6", -1);
    tell(FaultRaised, 100, 17);
    EXPECT_EQ(rows().at(0).boardIndex, 0U);
}

TEST_F(FaultListenerTest, EveryFaultOfAStormIsCountedAndMemoryIsBounded) {
    insert("A", 1);
    for (std::uint32_t fault = 0; fault < 10000; ++fault)
        tell(FaultRaised, 1, static_cast<std::uint16_t>(fault));
    Faults const faults = m_faults.read(Clock::now());
    EXPECT_EQ(faults.rows.size(), FaultLog::kCapacity);
    EXPECT_EQ(faults.raised, 10000U);
    EXPECT_EQ(faults.unlisted, 10000U - FaultLog::kCapacity);
    EXPECT_EQ(m_queue.size(), NotificationQueue::kCapacity);
    EXPECT_EQ(m_counters.notificationsDropped, 10000U - NotificationQueue::kCapacity);
}

TEST_F(FaultListenerTest, NothingIsEnteredAfterTheStop) {
    insert("A", 1);
    m_listener.stop();
    tell(FaultRaised, 1, 17);
    EXPECT_TRUE(rows().empty());
    EXPECT_EQ(m_queue.size(), 0U);
    EXPECT_EQ(m_told, 0);
}

} // namespace
} // namespace kvloamd
