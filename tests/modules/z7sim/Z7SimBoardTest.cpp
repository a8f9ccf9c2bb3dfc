// SPDX-License-Identifier: BSD-2-Clause
// The reference board: what it answers, and how it comes up, goes down, and falls silent.
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "Z7SimBoard.h"
#include "board/BoardManager.h"
#include "tests/modules/z7sim/OpenFactory.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/StatusLog.h"

namespace {

constexpr char const* kWhole =
    "NAME: NX5-T1, DESCRIPTION: Trunk board, FAMILY: NX5, FIRMWARE_NAME: nx5.fw, "
    "FIRMWARE_VERSION: \"4.2\", PCI_SLOT_NUMBER: 4, PCI_BUS_NUMBER: 2, SHELF_ID: 1, "
    "CHASSIS_SLOT: 3, MEMBASEADDR: 0xD000, IOBASEADDR: 0xE800, IRQ: 11, "
    "Board Id (BLT ID): 16, LOGICAL ID: 7";

/// One board, number 5, as the reference factory makes it.
class Z7SimBoardTest : public testing::Test {
  protected:
    Z7SimBoardTest() {
        m_factory->SetPingInterval(0);
        m_manager->AddBoardStatusListener(&m_log);
    }

    /// Attaches the factory to a chassis of board 5 with these attributes.
    void plugIn(std::string const& attributes) {
        sim::load({sim::board(5, "S5", attributes)});
        m_manager->Attach(m_handle);
        m_board = m_manager->GetFirstBoard();
        m_log.clear();
    }
    Z7SimBoard& board() { return *static_cast<Z7SimBoard*>(m_board.get()); }
    void deliver(BoardStatusEnum status) { board().ProcessExternalEvent(status); }
    void ping() { m_factory->ping_boards(); }
    std::string text(int (Board::*query)(char*)) {
        char buffer[256];
        EXPECT_EQ((m_board.get()->*query)(buffer), 0);
        return buffer;
    }
    std::string error() { return text(&Board::GetErrorMessage); }
    void expectState(BoardStatusEnum status, BoardStatusEnum secondary) {
        EXPECT_EQ(m_board->GetStatus(), status);
        EXPECT_EQ(m_board->GetSecondaryStatus(), secondary);
    }

    StatusLog m_log;
    ReferenceCounter<BoardManager> m_manager{new BoardManager};
    OpenFactory* m_factory = new OpenFactory;
    ReferenceCounter<BoardFactory> m_handle{m_factory};
    ReferenceCounter<Board> m_board;
};

using Statuses = std::vector<int>;

TEST_F(Z7SimBoardTest, EveryQueryAnswersFromTheChassis) {
    plugIn(kWhole);
    EXPECT_EQ(text(&Board::GetName), "NX5-T1");
    EXPECT_EQ(text(&Board::GetModel), "NX5-T1");
    EXPECT_EQ(text(&Board::GetFamily), "NX5");
    EXPECT_EQ(text(&Board::GetFirmwareName), "nx5.fw");
    EXPECT_EQ(text(&Board::GetFirmwareVersion), "4.2");
    EXPECT_EQ(text(&Board::GetSerialNumber), "S5");
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "Trunk board");
    EXPECT_EQ(error(), "");
    EXPECT_EQ(m_board->GetLogicalID(), 7);
    EXPECT_EQ(m_board->GetBoardID(), 16);
    EXPECT_EQ(m_board->GetSharedMemoryBaseAddress(), 0xD000);
    EXPECT_EQ(m_board->GetIOBaseAddress(), 0xE800);
    EXPECT_EQ(m_board->GetIRQ(), 11);
    EXPECT_EQ(m_board->GetShelfID(), 1);
    EXPECT_EQ(m_board->GetPCISlotNumber(), 4);
    EXPECT_EQ(m_board->GetBusNumber(), 2);
    EXPECT_EQ(board().GetChassisSlotNumber(), 3);
}

TEST_F(Z7SimBoardTest, BareBoardAnswersUnknownAndMinusOne) {
    plugIn("BOARD_CONDITION: 4");
    EXPECT_EQ(text(&Board::GetName), "unknown");
    EXPECT_EQ(text(&Board::GetFamily), "unknown");
    EXPECT_EQ(text(&Board::GetFirmwareVersion), "unknown");
    EXPECT_EQ(m_board->GetLogicalID(), -1);
    EXPECT_EQ(m_board->GetBoardID(), -1);
    EXPECT_EQ(m_board->GetShelfID(), -1);
}

TEST_F(Z7SimBoardTest, BoardInConditionThreeComesUpStarted) {
    plugIn("BOARD_CONDITION: 3");
    expectState(BoardStatusStarted, BoardStatusNone);
}

TEST_F(Z7SimBoardTest, StartedBoardAnnouncesItselfStarted) {
    sim::load({sim::board(5, "S5")});
    m_manager->Attach(m_handle);
    EXPECT_EQ(m_log.statuses(), (Statuses{BoardStatusAdded, BoardStatusStarted}));
}

TEST_F(Z7SimBoardTest, BoardInConditionFifteenComesUpFailed) {
    plugIn("BOARD_CONDITION: 15");
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board is reported failed by the platform");
}

TEST_F(Z7SimBoardTest, BoardInAnyOtherConditionComesUpStopped) {
    for (char const* const condition : {"4", "13", "14", "0", "{short: 4}"}) {
        sim::load({sim::board(5, "S5", "BOARD_CONDITION: " + std::string(condition))});
        m_board = ReferenceCounter<Board>(m_factory->MakeBoard(5));
        expectState(BoardStatusStopped, BoardStatusNone);
    }
}

TEST_F(Z7SimBoardTest, BoardWithoutConditionComesUpStopped) {
    sim::load({sim::board(5, "S5")});
    sim::unset(5, "BOARD_CONDITION");
    m_board = ReferenceCounter<Board>(m_factory->MakeBoard(5));
    expectState(BoardStatusStopped, BoardStatusNone);
}

TEST_F(Z7SimBoardTest, BoardThatIsNotPresentComesUpFailed) {
    plugIn("BOARD_PRESENT: 0");
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board does not answer");
}

TEST_F(Z7SimBoardTest, NewBoardKeepsThePlatformsChangeDate) {
    sim::load({sim::board(5, "S5", "STATE_CHANGE_DATE: \"Tue Mar  2 09:05:00 2004\"")});
    m_board = ReferenceCounter<Board>(m_factory->MakeBoard(5));
    EXPECT_EQ(m_board->GetDeviceChangeDate(), DevMapBoardIf(5).StateChangeDate());
    EXPECT_GT(m_board->GetDeviceChangeDate(), 0);
}

TEST_F(Z7SimBoardTest, StatusThreeStartsAndFourStops) {
    plugIn("BOARD_CONDITION: 4");
    deliver(BoardStatusStarted);
    expectState(BoardStatusStarted, BoardStatusNone);
    deliver(BoardStatusStopped);
    expectState(BoardStatusStopped, BoardStatusNone);
    EXPECT_EQ(m_log.statuses(), (Statuses{3, 4}));
}

TEST_F(Z7SimBoardTest, StatusFifteenFailsTheBoardWithAMessage) {
    plugIn("");
    deliver(BoardStatusFailed);
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board is reported failed by the platform");
    EXPECT_EQ(m_log.statuses(), (Statuses{15}));
}

TEST_F(Z7SimBoardTest, StartAfterAFailureClearsItAndItsMessage) {
    plugIn("BOARD_CONDITION: 15");
    deliver(BoardStatusStarted);
    expectState(BoardStatusStarted, BoardStatusNone);
    EXPECT_EQ(error(), "");
    EXPECT_EQ(m_log.statuses(), (Statuses{3}));
}

TEST_F(Z7SimBoardTest, MessageIsThereWhenListenersHearOfTheFailure) {
    class Reading final : public BoardStatusListener {
      public:
        int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override {
            event->GetBoard()->GetErrorMessage(message);
            return 0;
        }
        char message[256] = "";
    } reading;
    plugIn("");
    m_manager->AddBoardStatusListener(&reading);
    deliver(BoardStatusFailed);
    EXPECT_STREQ(reading.message, "board is reported failed by the platform");
    m_manager = {};
}

TEST_F(Z7SimBoardTest, StartReadsTextsAndLogicalIdentifierAnew) {
    plugIn(kWhole);
    sim::set(5, "NAME", "NX5-E1");
    sim::set(5, "FIRMWARE_VERSION", "4.3");
    sim::set(5, "LOGICAL ID", 8);
    EXPECT_EQ(text(&Board::GetName), "NX5-T1") << "a query asked the platform";
    EXPECT_EQ(m_board->GetLogicalID(), 7) << "a query asked the platform";
    deliver(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetName), "NX5-E1");
    EXPECT_EQ(text(&Board::GetFirmwareVersion), "4.3");
    EXPECT_EQ(m_board->GetLogicalID(), 8);
}

TEST_F(Z7SimBoardTest, BoardThatDoesNotAnswerFailsInsteadOfStarting) {
    plugIn("BOARD_CONDITION: 4, BOARD_PRESENT: 0");
    deliver(BoardStatusStarted);
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board does not answer");
    EXPECT_EQ(m_log.statuses(), (Statuses{15})) << "nobody may hear of a start";
}

TEST_F(Z7SimBoardTest, SecondStartInVainTellsNobodyAgain) {
    plugIn("BOARD_CONDITION: 4, BOARD_PRESENT: 0");
    deliver(BoardStatusStarted);
    deliver(BoardStatusStarted);
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board does not answer");
    EXPECT_EQ(m_log.statuses(), (Statuses{15}));
}

TEST_F(Z7SimBoardTest, BoardExchangedUnnoticedDoesNotRunUnderTheOldName) {
    plugIn("BOARD_CONDITION: 4");
    sim::set(5, "SERIAL_NUMBER", "other");
    deliver(BoardStatusStarted);
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "another board answers in its place");
}

TEST_F(Z7SimBoardTest, PingOfAnAnsweringBoardChangesNothing) {
    plugIn("");
    EXPECT_EQ(board().PingBoard(), 0);
    expectState(BoardStatusStarted, BoardStatusNone);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(Z7SimBoardTest, PingFailsABoardThatIsNoLongerPresent) {
    plugIn("");
    sim::set(5, "BOARD_PRESENT", 0);
    EXPECT_EQ(board().PingBoard(), -1);
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board does not answer");
    EXPECT_EQ(m_log.statuses(), (Statuses{15}));
}

TEST_F(Z7SimBoardTest, PingFailsABoardOfWhichThePlatformSaysNothing) {
    plugIn("");
    sim::unset(5, "BOARD_PRESENT");
    ping();
    expectState(BoardStatusStopped, BoardStatusFailed);
}

TEST_F(Z7SimBoardTest, PingFailsABoardForWhichTheRequestFails) {
    plugIn("");
    sim::load({}); // gone from the platform, and no rescan yet
    ping();
    expectState(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(error(), "board does not answer");
}

TEST_F(Z7SimBoardTest, PingsTellOfASilentBoardOnce) {
    plugIn("");
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    ping();
    EXPECT_EQ(m_log.statuses(), (Statuses{15}));
}

TEST_F(Z7SimBoardTest, PingStartsABoardThatAnswersAgain) {
    plugIn("");
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    expectState(BoardStatusStarted, BoardStatusNone);
    EXPECT_EQ(error(), "");
    EXPECT_EQ(m_log.statuses(), (Statuses{15, 3}));
}

TEST_F(Z7SimBoardTest, PingStartsABoardThatWasSilentFromTheBeginning) {
    plugIn("BOARD_PRESENT: 0");
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    expectState(BoardStatusStarted, BoardStatusNone);
}

TEST_F(Z7SimBoardTest, PingLeavesAStoppedBoardAlone) {
    plugIn("BOARD_CONDITION: 4");
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    expectState(BoardStatusStopped, BoardStatusNone);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(Z7SimBoardTest, PingDoesNotStartABoardThatThePlatformReportedFailed) {
    plugIn("");
    deliver(BoardStatusFailed);
    ping();
    expectState(BoardStatusStopped, BoardStatusFailed);
}

TEST_F(Z7SimBoardTest, PingDoesNotStartASilentBoardThatWasStoppedMeanwhile) {
    plugIn("");
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    deliver(BoardStatusStopped);
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    EXPECT_EQ(m_board->GetStatus(), BoardStatusStopped);
}

TEST_F(Z7SimBoardTest, PendingStatusDoesNotEndTheWatchOverASilentBoard) {
    plugIn("");
    sim::set(5, "BOARD_PRESENT", 0);
    ping();
    deliver(BoardStatusStartPending);
    sim::set(5, "BOARD_PRESENT", 1);
    ping();
    EXPECT_EQ(m_board->GetStatus(), BoardStatusStarted);
}

TEST_F(Z7SimBoardTest, BoardThatHasGoneIsOutOfServiceAndTellsNothingMore) {
    plugIn("");
    sim::load({});
    m_factory->check_for_changed_boards();
    board().PingBoard();
    deliver(BoardStatusFailed);
    deliver(BoardStatusStarted);
    EXPECT_EQ(m_board->GetStatus(), BoardStatusStopped);
    EXPECT_EQ(m_log.statuses(), (Statuses{BoardStatusRemoved}));
}

} // namespace
