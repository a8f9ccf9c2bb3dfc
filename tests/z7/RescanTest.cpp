// SPDX-License-Identifier: BSD-2-Clause
// The Z7 factory's rescan: boards that are removed, added or replaced.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "board/BoardManager.h"
#include "core/ReferenceTable.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/StatusLog.h"
#include "tests/z7/RecordingFactory.h"

namespace {

/// An attached factory with the boards 1 ("A") and 2 ("B").
class RescanTest : public testing::Test {
  protected:
    RescanTest() {
        sim::load({sim::board(1, "A"), sim::board(2, "B")});
        m_factory->SetPingInterval(0);
        m_manager->Attach(m_handle);
        m_manager->AddBoardStatusListener(&m_log);
    }
    /// "index:identifier:serial number" of every board.
    std::string boards() {
        std::string text;
        for (int i = m_manager->GetFirstBoardIndex(); i != 0; i = m_manager->GetNextBoardIndex(i)) {
            ReferenceCounter<Board> const board = m_manager->GetBoardByIndex(i);
            char serialNumber[256];
            board->GetSerialNumber(serialNumber);
            text += std::to_string(i) + ":" +
                    std::to_string(static_cast<Z7Board*>(board.get())->GetBoardIdentifier()) + ":" +
                    serialNumber + " ";
        }
        return text;
    }
    int rescan() { return m_factory->check_for_changed_boards(); }

    StatusLog m_log;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    RecordingFactory* m_factory = new RecordingFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
};

TEST_F(RescanTest, NothingHappensWhenNothingChanged) {
    EXPECT_EQ(rescan(), 0);
    EXPECT_EQ(boards(), "1:1:A 2:2:B ");
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(RescanTest, BoardThatWentIsAnnouncedAndTakenOut) {
    ReferenceCounter<Board> const gone = m_manager->GetBoardByIndex(1);
    sim::load({sim::board(2, "B")});
    rescan();
    EXPECT_EQ(boards(), "2:2:B ");
    EXPECT_EQ(m_log.statusesOf(gone), (std::vector<int>{BoardStatusRemoved}));
}

TEST_F(RescanTest, BoardThatWentHearsNoMoreMessages) {
    ReferenceCounter<Board> const gone = m_manager->GetBoardByIndex(1);
    sim::load({sim::board(2, "B")});
    rescan();
    m_factory->notify_board(1, BoardStatusStarted);
    EXPECT_EQ(gone->GetStatus(), BoardStatusStopped);
}

TEST_F(RescanTest, BoardThatWentIsDroppedWhenNobodyHoldsIt) {
    m_manager->AddBoardStatusListener(&m_log);
    int const before = ReferenceTable::get_instance()->referenced_objects();
    sim::load({sim::board(2, "B")});
    rescan();
    m_log.clear();
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before - 1);
}

TEST_F(RescanTest, BoardIsStillInTheTableWhileItsGoingIsAnnounced) {
    class Looking final : public BoardStatusListener {
      public:
        explicit Looking(BoardManager* manager) : m_manager(manager) {}
        int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
            index = m_manager->GetIndexByBoard(event->GetBoard());
            return 0;
        }
        int index = -1;

      private:
        BoardManager* m_manager;
    } looking(m_manager.get());
    m_manager->AddBoardStatusListener(&looking);
    sim::load({sim::board(1, "A")});
    rescan();
    EXPECT_EQ(looking.index, 2);
    m_manager = {};
}

TEST_F(RescanTest, NewBoardGetsTheNextIndex) {
    sim::load({sim::board(1, "A"), sim::board(2, "B"), sim::board(3, "C")});
    rescan();
    EXPECT_EQ(boards(), "1:1:A 2:2:B 3:3:C ");
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusAdded, BoardStatusStopped}));
}

TEST_F(RescanTest, BoardThatWentAndCameBackIsANewBoard) {
    sim::load({sim::board(2, "B")});
    rescan();
    sim::load({sim::board(1, "A"), sim::board(2, "B")});
    rescan();
    EXPECT_EQ(boards(), "2:2:B 3:1:A ");
}

TEST_F(RescanTest, ChangedSerialNumberMakesAnotherBoard) {
    ReferenceCounter<Board> const old = m_manager->GetBoardByIndex(1);
    sim::set(1, "SERIAL_NUMBER", "Z");
    rescan();
    EXPECT_EQ(boards(), "2:2:B 3:1:Z ");
    EXPECT_EQ(m_log.statusesOf(old), (std::vector<int>{BoardStatusRemoved}));
    EXPECT_EQ(m_log.statusesOf(m_manager->GetBoardByIndex(3)),
              (std::vector<int>{BoardStatusAdded, BoardStatusStopped}));
}

TEST_F(RescanTest, ChangedSerialNumberGoesUnnoticedUntilARescan) {
    sim::set(1, "SERIAL_NUMBER", "Z");
    m_factory->notify_all_boards(BoardStatusStarted);
    EXPECT_EQ(boards(), "1:1:A 2:2:B ");
}

TEST_F(RescanTest, SerialNumberThatGoesMissingMakesAnotherBoard) {
    sim::unset(1, "SERIAL_NUMBER");
    rescan();
    EXPECT_EQ(boards(), "2:2:B 3:1:unknown ");
}

TEST_F(RescanTest, BoardsThatGoAreAnnouncedBeforeBoardsThatCome) {
    sim::load({sim::board(3, "C"), sim::board(2, "Z")});
    rescan();
    EXPECT_EQ(boards(), "3:3:C 4:2:Z ");
    EXPECT_EQ(m_log.statuses(),
              (std::vector<int>{BoardStatusRemoved, BoardStatusRemoved, BoardStatusAdded,
                                BoardStatusStopped, BoardStatusAdded, BoardStatusStopped}));
}

TEST_F(RescanTest, NewBoardsAreMadeInTheOrderInWhichTheyAreFound) {
    sim::load({sim::board(9, "I"), sim::board(1, "A"), sim::board(4, "D"), sim::board(2, "B")});
    rescan();
    EXPECT_EQ(boards(), "1:1:A 2:2:B 3:9:I 4:4:D ");
}

TEST_F(RescanTest, InsertedBoardIsThereWhenItsStartIsDelivered) {
    sim::command({{"command", "insert"},
                  {"board", {{"handle", 7}, {"attributes", {{"SERIAL_NUMBER", "G"}}}}}});
    sim::drain();
    EXPECT_EQ(boards(), "1:1:A 2:2:B 3:7:G ");
    EXPECT_EQ(m_log.statuses(),
              (std::vector<int>{BoardStatusAdded, BoardStatusStopped, BoardStatusStarted}));
}

TEST_F(RescanTest, RemovedBoardGoesWithoutBeingStopped) {
    sim::command({{"command", "remove"}, {"board", 1}});
    sim::drain();
    EXPECT_EQ(boards(), "2:2:B ");
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusRemoved}));
}

TEST_F(RescanTest, ReplacedBoardIsExchangedAndStarted) {
    sim::command({{"command", "replace"}, {"board", 2}, {"serial", "Y"}});
    sim::drain();
    EXPECT_EQ(boards(), "1:1:A 3:2:Y ");
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{BoardStatusRemoved, BoardStatusAdded,
                                                  BoardStatusStopped, BoardStatusStarted}));
}

} // namespace
