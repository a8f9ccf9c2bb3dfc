// SPDX-License-Identifier: BSD-2-Clause
// The Z7 factory: creating, announcing, replacing, pinging and notifying boards.
#include <chrono>
#include <future>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "core/ReferenceTable.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/Slots.h"
#include "tests/support/StatusLog.h"
#include "tests/z7/RecordingFactory.h"

namespace {

class Z7BoardFactoryTest : public testing::Test {
  protected:
    Z7BoardFactoryTest() {
        m_factory->SetPingInterval(0);
        m_manager->AddBoardStatusListener(&m_log);
    }
    void attach() { m_manager->Attach(m_handle); }
    void tell(std::uint32_t message, int board = 0) {
        m_factory->ProcessExternalEvent(
            ReferenceCounter<ExternalEvent>(new ExternalEvent(message, board)));
    }
    RecordingBoard& board(int index) {
        return *static_cast<RecordingBoard*>(m_manager->GetBoardByIndex(index).get());
    }
    std::vector<long> identifiers() {
        std::vector<long> all;
        for (int i = m_manager->GetFirstBoardIndex(); i != 0; i = m_manager->GetNextBoardIndex(i))
            all.push_back(board(i).GetBoardIdentifier());
        return all;
    }

    StatusLog m_log;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    RecordingFactory* m_factory = new RecordingFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
};

TEST_F(Z7BoardFactoryTest, BoardsPresentAreEnteredInTheirOrder) {
    sim::load({sim::board(9, "A"), sim::board(3, "B"), sim::board(5, "C")});
    attach();
    EXPECT_EQ(identifiers(), (std::vector<long>{9, 3, 5}));
    EXPECT_EQ(m_manager->GetNumberOfBoards(), 3);
}

TEST_F(Z7BoardFactoryTest, DataIsRefreshedBeforeTheFirstBoardIsMade) {
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    attach();
    EXPECT_EQ(m_factory->calls, "list refresh make1 make2 ");
}

TEST_F(Z7BoardFactoryTest, NewBoardIsAnnouncedAndThenItsStatus) {
    sim::load({sim::board(1, "A")});
    m_factory->firstStatus = BoardStatusStarted;
    attach();
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusAdded, BoardStatusStarted}));
}

TEST_F(Z7BoardFactoryTest, NewBoardIsInTheTableWhenItIsAnnounced) {
    class Looking final : public BoardStatusListener {
      public:
        explicit Looking(BoardManager* manager) : m_manager(manager) {}
        int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
            indices.push_back(m_manager->GetIndexByBoard(event->GetBoard()));
            return 0;
        }
        std::vector<int> indices;

      private:
        BoardManager* m_manager;
    } looking(m_manager.get());
    m_manager->AddBoardStatusListener(&looking);
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    attach();
    EXPECT_EQ(looking.indices, (std::vector{1, 1, 2, 2}));
    m_manager = {};
}

TEST_F(Z7BoardFactoryTest, StatusChangesOfBoardsReachTheAgent) {
    sim::load({sim::board(1, "A")});
    attach();
    m_log.clear();
    board(1).ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(m_log.statusesOf(m_manager->GetBoardByIndex(1)), (std::vector<int>{3}));
}

TEST_F(Z7BoardFactoryTest, BoardThatCanNotBeMadeIsLeftOut) {
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    m_factory->unbuildable = 1;
    attach();
    EXPECT_EQ(identifiers(), (std::vector<long>{2}));
    EXPECT_EQ(m_factory->create_board(1), -1);
    EXPECT_EQ(m_factory->create_board(2), 0);
}

TEST_F(Z7BoardFactoryTest, NoPingThreadWhenTheIntervalIsZero) {
    sim::load({});
    attach();
    EXPECT_EQ(m_factory->GetThreadState(), KVLThreadNotRunning);
}

TEST_F(Z7BoardFactoryTest, NoPingThreadWhenTheIntervalIsNegative) {
    sim::load({});
    m_factory->SetPingInterval(-1);
    attach();
    EXPECT_EQ(m_factory->GetThreadState(), KVLThreadNotRunning);
}

TEST_F(Z7BoardFactoryTest, PingThreadStartsWithAPositiveInterval) {
    sim::load({});
    m_factory->SetPingInterval(Z7BoardFactory::kDefaultPingInterval);
    EXPECT_EQ(m_factory->GetThreadState(), KVLThreadNotRunning) << "before it is initialised";
    attach();
    EXPECT_EQ(m_factory->GetThreadState(), KVLThreadRunning);
}

TEST_F(Z7BoardFactoryTest, PingsFollowARefreshInTheOrderOfIdentifiers) {
    sim::load({sim::board(9, "A"), sim::board(3, "B")});
    attach();
    m_factory->calls.clear();
    for (int const index : {1, 2})
        board(index).onPing = [this, index] {
            m_factory->calls += "ping" + std::to_string(board(index).GetBoardIdentifier()) + " ";
        };
    EXPECT_EQ(m_factory->ping_boards(), 0);
    EXPECT_EQ(m_factory->calls, "refresh ping3 ping9 ");
}

TEST_F(Z7BoardFactoryTest, PingsRunWithoutTheFactorysLock) {
    sim::load({sim::board(1, "A")});
    attach();
    bool free = false;
    board(1).onPing = [&] {
        auto lock = std::async(std::launch::async, [this] {
            m_factory->lock();
            m_factory->unlock();
        });
        free = lock.wait_for(std::chrono::minutes(1)) == std::future_status::ready;
    };
    m_factory->ping_boards();
    EXPECT_TRUE(free);
}

TEST_F(Z7BoardFactoryTest, BoardDroppedDuringAPassIsStillPinged) {
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    attach();
    ReferenceCounter<Board> const second = m_manager->GetBoardByIndex(2);
    board(1).onPing = [this] {
        sim::load({sim::board(1, "A")});
        m_factory->check_for_changed_boards();
    };
    m_factory->ping_boards();
    EXPECT_EQ(static_cast<RecordingBoard*>(second.get())->calls, "ping");
    EXPECT_EQ(identifiers(), (std::vector<long>{1}));
}

TEST_F(Z7BoardFactoryTest, OnlyThreeMessagesRescan) {
    std::vector<std::uint32_t> rescanning;
    for (std::uint32_t message = 0x40000; message <= 0x4000B; ++message) {
        sim::load({sim::board(1, "A")});
        if (m_manager->GetNumberOfBoards() == 0) attach();
        tell(0x40001);
        m_factory->calls.clear();
        tell(message, 99);
        if (m_factory->calls.find("list") != std::string::npos) rescanning.push_back(message);
    }
    EXPECT_EQ(rescanning, (std::vector<std::uint32_t>{0x40001, 0x40005, 0x40007}));
}

struct Delivery {
    std::uint32_t message;
    BoardStatusEnum firstStatus;
    char const* first;  ///< calls of board 1, which the message names
    char const* second; ///< calls of board 2
    int condition;      ///< of board 1 afterwards
};

class Z7BoardFactoryDeliveryTest : public Z7BoardFactoryTest,
                                   public testing::WithParamInterface<Delivery> {};

constexpr char const* kStart = "stage1 stage2 stage3 features ipethernet status3 tell3";
constexpr char const* kStop = "status4 tell4 stop nofeatures";
constexpr char const* kFail = "status4 stop nofeatures secondary15 tell15";

TEST_P(Z7BoardFactoryDeliveryTest, MessageBecomesAStatusOfItsBoards) {
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    m_factory->firstStatus = GetParam().firstStatus;
    attach();
    tell(GetParam().message, 1);
    EXPECT_EQ(board(1).calls, GetParam().first);
    EXPECT_EQ(board(2).calls, GetParam().second);
    EXPECT_EQ(board(1).GetLastCondition(), GetParam().condition);
}

INSTANTIATE_TEST_SUITE_P(EveryMessage, Z7BoardFactoryDeliveryTest,
                         testing::Values(Delivery{0x40001, BoardStatusStopped, kStart, kStart, 0},
                                         Delivery{0x40002, BoardStatusStarted, kStop, kStop, 0},
                                         Delivery{0x40003, BoardStatusStopped, "", "", 13},
                                         Delivery{0x40004, BoardStatusStarted, "", "", 14},
                                         Delivery{0x40005, BoardStatusStarted, kStop, "", 0},
                                         Delivery{0x40006, BoardStatusStarted, kFail, "", 0},
                                         Delivery{0x40007, BoardStatusStopped, kStart, "", 0},
                                         Delivery{0x40008, BoardStatusStarted, kStop, "", 0},
                                         Delivery{0x40009, BoardStatusStopped, "", "", 13},
                                         Delivery{0x4000A, BoardStatusStarted, "", "", 14},
                                         Delivery{0x40000, BoardStatusStarted, "", "", 0},
                                         Delivery{0x4000B, BoardStatusStarted, "", "", 0}),
                         [](auto const& row) {
                             return "Message" + std::to_string(row.param.message);
                         });

TEST_F(Z7BoardFactoryTest, PendingMessageReachesEveryBoardWithoutARescan) {
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    attach();
    sim::load({sim::board(1, "A"), sim::board(3, "C")});
    tell(0x40003);
    EXPECT_EQ(board(1).GetLastCondition(), BoardStatusStartPending);
    EXPECT_EQ(board(2).GetLastCondition(), BoardStatusStartPending);
    EXPECT_EQ(identifiers(), (std::vector<long>{1, 2}));
}

TEST_F(Z7BoardFactoryTest, MessageForABoardThatIsNotThereDoesNothing) {
    sim::load({sim::board(1, "A")});
    attach();
    m_log.clear();
    tell(0x40006, 7);
    EXPECT_TRUE(m_log.statuses().empty());
    EXPECT_EQ(board(1).calls, "");
}

TEST_F(Z7BoardFactoryTest, NotifyAnswersMinusOneInEveryCase) {
    sim::load({sim::board(1, "A")});
    attach();
    EXPECT_EQ(m_factory->notify_board(1, BoardStatusStarted), -1);
    EXPECT_EQ(m_factory->notify_board(2, BoardStatusStarted), -1);
    EXPECT_EQ(m_factory->notify_all_boards(BoardStatusStopped), -1);
}

TEST_F(Z7BoardFactoryTest, AllBoardsAreNotifiedInTheOrderOfIdentifiers) {
    sim::load({sim::board(9, "A"), sim::board(3, "B"), sim::board(5, "C")});
    attach();
    m_log.clear();
    m_factory->notify_all_boards(BoardStatusStarted);
    std::vector<long> order;
    for (auto const& entry : m_log.entries())
        order.push_back(static_cast<Z7Board*>(entry.board.get())->GetBoardIdentifier());
    EXPECT_EQ(order, (std::vector<long>{3, 5, 9}));
}

TEST_F(Z7BoardFactoryTest, EventFromThePlatformReachesTheAgent) {
    sim::load({sim::board(5, "S5")});
    attach();
    m_log.clear();
    sim::deliver(0x40007, 5);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusStarted}));
    m_manager = {};
}

TEST_F(Z7BoardFactoryTest, EventAfterTheManagerHasGoneStillReachesTheBoards) {
    sim::load({sim::board(1, "A")});
    attach();
    ReferenceCounter<Board> const first = m_manager->GetBoardByIndex(1);
    m_manager = {};
    m_log.clear();
    tell(0x40007, 1);
    EXPECT_EQ(first->GetStatus(), BoardStatusStarted);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(Z7BoardFactoryTest, UpdateDoesNothing) {
    EXPECT_EQ(m_factory->Update(), -1);
    EXPECT_EQ(m_factory->calls, "");
}

TEST_F(Z7BoardFactoryTest, LaterBoardsGoToTheTableAttachedLast) {
    sim::load({sim::board(1, "A")});
    attach();
    ReferenceCounter<BoardTable> const other(new BoardTable);
    m_factory->AttachBoardTable(other);
    m_factory->create_board(1);
    EXPECT_NE((*other.get())[1].get(), nullptr);
    EXPECT_EQ(m_manager->GetNumberOfBoards(), 1);
}

TEST_F(Z7BoardFactoryTest, OperationsKeepTheirSlots) {
    int slot = slotOf(&Z7BoardFactory::NotifyBoardStatusListeners);
    EXPECT_EQ(slot, 5);
    EXPECT_EQ(slotOf(&Z7BoardFactory::Update), ++slot);
    EXPECT_EQ(slotOf(&Z7BoardFactory::ProcessBoardStatusEvent), ++slot);
    EXPECT_EQ(slotOf(&Z7BoardFactory::ProcessExternalEvent), ++slot);
    EXPECT_EQ(slotOf(&Z7BoardFactory::SetPingInterval), ++slot);
    EXPECT_EQ(slotOf(&RecordingFactory::create_board), ++slot);
    EXPECT_EQ(slotOf(&RecordingFactory::check_for_changed_boards), ++slot);
    EXPECT_EQ(slotOf(&Z7BoardFactory::Run), ++slot);
}

// Like every use of an empty handle, one instead of an object ends the process.

using Z7BoardFactoryDeathTest = Z7BoardFactoryTest;

constexpr char const* kFatal = "FATAL! ReferenceCounter operator-> returns NULL\nCalling abort";

TEST_F(Z7BoardFactoryDeathTest, EmptyEventAborts) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    EXPECT_DEATH(m_factory->ProcessExternalEvent({}), kFatal);
    EXPECT_DEATH(m_factory->ProcessBoardStatusEvent({}), kFatal);
}

TEST_F(Z7BoardFactoryDeathTest, EmptyTableAborts) {
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    sim::load({sim::board(1, "A")});
    EXPECT_DEATH(m_factory->Initialize({}), kFatal);
}

} // namespace
