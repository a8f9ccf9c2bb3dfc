// SPDX-License-Identifier: BSD-2-Clause
// The manager's walks over the boards, its factories and its listeners.
#include <functional>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "core/ReferenceTable.h"
#include "tests/support/PlainBoard.h"
#include "tests/support/Slots.h"
#include "tests/support/StatusLog.h"

namespace {

using BoardHandle = ReferenceCounter<Board>;

/// A factory that enters boards when the test asks, and records how it was attached.
class HandFactory final : public BoardFactory {
  public:
    int Initialize(ReferenceCounter<BoardTable> table) override {
        ++initializations;
        AttachBoardTable(table);
        onInitialize();
        return 0;
    }
    int AttachBoardTable(ReferenceCounter<BoardTable> table) override {
        m_table = table;
        return 0;
    }

    BoardHandle enter() {
        BoardHandle board(new PlainBoard);
        enter_at_next_index(*m_table.get(), board);
        return board;
    }
    void remove(BoardHandle const& board) { m_table->remove(board); }
    BoardTable* table() const { return m_table.get(); }

    int initializations = 0;
    std::function<void()> onInitialize = [] {};

  private:
    ReferenceCounter<BoardTable> m_table;
};

class BoardManagerTest : public testing::Test {
  protected:
    HandFactory& attach() {
        auto* const factory = new HandFactory;
        m_manager->Attach(ReferenceCounter<BoardFactory>(factory));
        return *factory;
    }
    std::vector<Board*> walkByBoard() {
        std::vector<Board*> boards;
        for (BoardHandle board = m_manager->GetFirstBoard(); board.get() != nullptr;
             board = m_manager->GetNextBoard(board))
            boards.push_back(board.get());
        return boards;
    }
    std::vector<int> walkByIndex() {
        std::vector<int> indices;
        for (int i = m_manager->GetFirstBoardIndex(); i != 0; i = m_manager->GetNextBoardIndex(i))
            indices.push_back(i);
        return indices;
    }

    StatusLog m_log;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
};

TEST_F(BoardManagerTest, ManagerWithoutFactoriesHasNoBoards) {
    EXPECT_EQ(m_manager->GetNumberOfBoards(), 0);
    EXPECT_EQ(m_manager->GetFirstBoardIndex(), 0);
    EXPECT_EQ(m_manager->GetFirstBoard().get(), nullptr);
    EXPECT_EQ(m_manager->GetBoardByIndex(1).get(), nullptr);
    EXPECT_EQ(m_manager->GetIndexByBoard(BoardHandle(new PlainBoard)), 0);
    EXPECT_EQ(m_manager->GetNextBoardIndex(0), 0);
}

TEST_F(BoardManagerTest, AttachedFactoryIsInitializedOnceWithTheTable) {
    HandFactory const& factory = attach();
    EXPECT_EQ(factory.initializations, 1);
    EXPECT_NE(factory.table(), nullptr);
}

TEST_F(BoardManagerTest, FactoriesShareOneTable) {
    HandFactory const& one = attach();
    HandFactory const& other = attach();
    EXPECT_EQ(one.table(), other.table());
}

TEST_F(BoardManagerTest, AttachListensBeforeTheFactoryIsInitialized) {
    auto* const factory = new HandFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    factory->onInitialize = [&] {
        factory->NotifyBoardStatusListeners(factory->enter(), BoardStatusAdded);
    };
    m_manager->AddBoardStatusListener(&m_log);
    EXPECT_EQ(m_manager->Attach(handle), 0);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusAdded}));
}

TEST_F(BoardManagerTest, FactoryAttachedTwiceIsInitializedTwiceButHeardOnce) {
    auto* const factory = new HandFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    m_manager->AddBoardStatusListener(&m_log);
    m_manager->Attach(handle);
    m_manager->Attach(handle);
    EXPECT_EQ(factory->initializations, 2);
    factory->NotifyBoardStatusListeners(factory->enter(), BoardStatusStarted);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusStarted}));
}

TEST_F(BoardManagerTest, WalksVisitBoardsInTheOrderOfEntry) {
    HandFactory& factory = attach();
    BoardHandle const first = factory.enter();
    BoardHandle const second = factory.enter();
    BoardHandle const third = factory.enter();
    EXPECT_EQ(walkByIndex(), (std::vector{1, 2, 3}));
    EXPECT_EQ(walkByBoard(), (std::vector{first.get(), second.get(), third.get()}));
    EXPECT_EQ(m_manager->GetNumberOfBoards(), 3);
    EXPECT_EQ(m_manager->GetIndexByBoard(third), 3);
    EXPECT_EQ(m_manager->GetBoardByIndex(2).get(), second.get());
}

TEST_F(BoardManagerTest, IndexOfARemovedBoardIsNotUsedAgain) {
    HandFactory& factory = attach();
    factory.enter();
    factory.remove(factory.enter());
    factory.enter();
    EXPECT_EQ(walkByIndex(), (std::vector{1, 3}));
}

TEST_F(BoardManagerTest, NextBoardAfterTheHighestIndexIsEmpty) {
    HandFactory& factory = attach();
    factory.enter();
    BoardHandle const last = factory.enter();
    EXPECT_EQ(m_manager->GetNextBoard(2).get(), nullptr);
    EXPECT_EQ(m_manager->GetNextBoard(last).get(), nullptr);
}

TEST_F(BoardManagerTest, NextBoardAfterAnAbsentIndexIsEmpty) {
    HandFactory& factory = attach();
    factory.enter();
    factory.remove(factory.enter());
    factory.enter();
    for (int const absent : {0, 2, 4, -1})
        EXPECT_EQ(m_manager->GetNextBoard(absent).get(), nullptr) << absent;
}

TEST_F(BoardManagerTest, WalkByBoardEndsWhenItsBoardIsRemoved) {
    HandFactory& factory = attach();
    BoardHandle const first = factory.enter();
    factory.enter();
    BoardHandle const current = m_manager->GetFirstBoard();
    factory.remove(first);
    EXPECT_EQ(m_manager->GetNextBoard(current).get(), nullptr);
}

TEST_F(BoardManagerTest, WalkByIndexGoesOnWithTheNextHigherIndex) {
    HandFactory& factory = attach();
    factory.enter();
    BoardHandle const second = factory.enter();
    factory.enter();
    int const at = m_manager->GetFirstBoardIndex();
    factory.remove(second);
    EXPECT_EQ(m_manager->GetNextBoardIndex(at), 3);
}

TEST_F(BoardManagerTest, WalkByBoardAsksTheOverriddenWalkByIndex) {
    class Recording final : public BoardManager {
      public:
        using BoardManager::GetNextBoard;
        BoardHandle GetNextBoard(int index) override {
            asked.push_back(index);
            return BoardManager::GetNextBoard(index);
        }
        int GetIndexByBoard(BoardHandle /*board*/) override { return 42; }
        std::vector<int> asked;
    };
    auto* const recording = new Recording;
    m_manager = ReferenceCounter<BoardManager>(recording);
    m_manager->GetNextBoard(BoardHandle(new PlainBoard));
    EXPECT_EQ(recording->asked, (std::vector{42}));
}

TEST_F(BoardManagerTest, StatusEventReachesTheAgentsListeners) {
    HandFactory& factory = attach();
    BoardHandle const board = factory.enter();
    EXPECT_EQ(m_manager->AddBoardStatusListener(&m_log), 0);
    factory.NotifyBoardStatusListeners(board, BoardStatusFailed);
    EXPECT_EQ(m_log.statusesOf(board), (std::vector<int>{BoardStatusFailed}));
}

TEST_F(BoardManagerTest, ListenersSeeTheFactorysEventObject) {
    StatusLog direct;
    HandFactory& factory = attach();
    factory.AddBoardStatusListener(&direct);
    m_manager->AddBoardStatusListener(&m_log);
    factory.NotifyBoardStatusListeners(factory.enter(), BoardStatusStarted);
    EXPECT_EQ(m_log.entries().at(0).event, direct.entries().at(0).event);
}

TEST_F(BoardManagerTest, StatusEventWithoutListenersIsDropped) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    ReferenceCounter<BoardStatusEvent> event(new BoardStatusEvent);
    EXPECT_EQ(m_manager->ProcessBoardStatusEvent(event), 0);
    event = {};
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(BoardManagerTest, StatusEventChangesNothingInTheTable) {
    HandFactory& factory = attach();
    BoardHandle const board = factory.enter();
    factory.NotifyBoardStatusListeners(board, BoardStatusRemoved);
    EXPECT_EQ(m_manager->GetIndexByBoard(board), 1);
}

TEST_F(BoardManagerTest, FactoryKeepsTheTableWhenTheManagerGoesFirst) {
    auto* const factory = new HandFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    m_manager->Attach(handle);
    BoardHandle const board = factory->enter();
    m_manager = {};
    EXPECT_EQ((*factory->table())[1].get(), board.get());
    factory->enter();
    EXPECT_EQ(factory->table()->next_index(1), 2);
}

TEST_F(BoardManagerTest, FactoryNoLongerTellsAManagerThatHasGone) {
    auto* const factory = new HandFactory;
    ReferenceCounter<BoardFactory> const handle(factory);
    m_manager->AddBoardStatusListener(&m_log);
    m_manager->Attach(handle);
    m_manager = {};
    factory->NotifyBoardStatusListeners(factory->enter(), BoardStatusStarted);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(BoardManagerTest, NothingIsLeftOfAManagerAndItsFactory) {
    m_manager = {};
    int const before = ReferenceTable::get_instance()->referenced_objects();
    m_manager = ReferenceCounter<BoardManager>(new BoardManager);
    attach().enter();
    m_manager = {};
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(BoardManagerTest, ManagerCanNotBeLocked) {
    testing::internal::CaptureStdout();
    EXPECT_EQ(m_manager->lock(), 99);
    EXPECT_EQ(testing::internal::GetCapturedStdout(),
              "Attempting to lock a non-lockable object...\n");
}

TEST_F(BoardManagerTest, OperationsKeepTheirSlots) {
    using ByIndex = BoardHandle (BoardManager::*)(int);
    using ByBoard = BoardHandle (BoardManager::*)(BoardHandle);
    EXPECT_EQ(slotOf(&BoardManager::GetFirstBoard), 2);
    EXPECT_EQ(slotOf(static_cast<ByIndex>(&BoardManager::GetNextBoard)), 3);
    EXPECT_EQ(slotOf(static_cast<ByBoard>(&BoardManager::GetNextBoard)), 4);
    EXPECT_EQ(slotOf(&BoardManager::GetBoardByIndex), 5);
    EXPECT_EQ(slotOf(&BoardManager::GetNumberOfBoards), 6);
    EXPECT_EQ(slotOf(&BoardManager::GetFirstBoardIndex), 7);
    EXPECT_EQ(slotOf(&BoardManager::GetIndexByBoard), 8);
    EXPECT_EQ(slotOf(&BoardManager::GetNextBoardIndex), 9);
    EXPECT_EQ(slotOf(&BoardManager::Attach), 10);
    EXPECT_EQ(slotOf(&BoardManager::AddBoardStatusListener), 11);
    EXPECT_EQ(slotOf(&BoardManager::ProcessBoardStatusEvent), 12);
}

class BoardFactoryTest : public testing::Test {
  protected:
    HandFactory* m_factory = new HandFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
    StatusLog m_log;
};

TEST_F(BoardFactoryTest, ListenerAddedTwiceIsCalledOnce) {
    EXPECT_EQ(m_factory->AddBoardStatusListener(&m_log), 0);
    EXPECT_EQ(m_factory->AddBoardStatusListener(&m_log), 0);
    m_factory->NotifyBoardStatusListeners({}, BoardStatusStarted);
    EXPECT_EQ(m_log.statuses().size(), 1U);
}

TEST_F(BoardFactoryTest, NotifyingNobodyMakesAndDeletesOneEvent) {
    int const before = ReferenceTable::get_instance()->referenced_objects();
    EXPECT_EQ(m_factory->NotifyBoardStatusListeners({}, BoardStatusStarted), 0);
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(BoardFactoryTest, RemovedListenerIsNotCalledAnyMore) {
    m_factory->AddBoardStatusListener(&m_log);
    EXPECT_EQ(m_factory->RemoveBoardStatusListener(&m_log), 0);
    EXPECT_EQ(m_factory->RemoveBoardStatusListener(&m_log), 1);
    m_factory->NotifyBoardStatusListeners({}, BoardStatusStarted);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(BoardFactoryTest, ListenerThatRemovesItselfEndsTheWalk) {
    class Leaving final : public BoardStatusListener {
      public:
        explicit Leaving(BoardFactory* factory) : m_factory(factory) {}
        int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> /*event*/) override {
            return m_factory->RemoveBoardStatusListener(this);
        }

      private:
        BoardFactory* m_factory;
    } leaving(m_factory);
    m_factory->AddBoardStatusListener(&leaving);
    m_factory->AddBoardStatusListener(&m_log);
    m_factory->NotifyBoardStatusListeners({}, BoardStatusStarted);
    EXPECT_TRUE(m_log.statuses().empty());
    m_factory->NotifyBoardStatusListeners({}, BoardStatusStopped);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusStopped}));
}

TEST_F(BoardFactoryTest, OperationsKeepTheirSlots) {
    EXPECT_EQ(slotOf(&BoardFactory::Initialize), 2);
    EXPECT_EQ(slotOf(&BoardFactory::AddBoardStatusListener), 3);
    EXPECT_EQ(slotOf(&BoardFactory::AttachBoardTable), 4);
    EXPECT_EQ(slotOf(&BoardFactory::NotifyBoardStatusListeners), 5);
}

} // namespace
