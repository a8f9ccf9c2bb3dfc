// SPDX-License-Identifier: BSD-2-Clause
// A Z7 board's record, its answers and its listeners.
#include <ctime>

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "core/ReferenceTable.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/Slots.h"
#include "tests/support/StatusLog.h"
#include "tests/z7/RecordingBoard.h"

namespace {

constexpr char const* kAttributes =
    "DESCRIPTION: Trunk board, PCI_SLOT_NUMBER: 4, PCI_BUS_NUMBER: 2, CHASSIS_SLOT: 3, "
    "MEMBASEADDR: 0xD000, IOBASEADDR: 0xE800, IRQ: 11, "
    "STATE_CHANGE_DATE: \"Tue Mar  2 09:05:00 2004\"";

class Z7BoardTest : public testing::Test {
  protected:
    Z7BoardTest() {
        sim::load({sim::board(5, "S5", kAttributes)});
        m_board = new RecordingBoard(5);
        m_handle = ReferenceCounter<Board>(m_board);
    }
    std::string text(int (Board::*query)(char*)) {
        char buffer[256];
        EXPECT_EQ((m_board->*query)(buffer), 0);
        return buffer;
    }

    RecordingBoard* m_board;
    ReferenceCounter<Board> m_handle;
    StatusLog m_log;
};

TEST_F(Z7BoardTest, HardwareQueriesAnswerFromTheRecord) {
    EXPECT_EQ(text(&Board::GetSerialNumber), "S5");
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "Trunk board");
    EXPECT_EQ(m_board->GetSharedMemoryBaseAddress(), 0xD000);
    EXPECT_EQ(m_board->GetIOBaseAddress(), 0xE800);
    EXPECT_EQ(m_board->GetIRQ(), 11);
    EXPECT_EQ(m_board->GetPCISlotNumber(), 4);
    EXPECT_EQ(m_board->GetBusNumber(), 2);
    EXPECT_EQ(m_board->GetChassisSlotNumber(), 3);
    EXPECT_EQ(m_board->GetBoardIdentifier(), 5);
}

TEST_F(Z7BoardTest, NewBoardHasNoErrorAndThePlatformsChangeDate) {
    EXPECT_EQ(text(&Board::GetErrorMessage), "");
    std::tm date{};
    date.tm_year = 104;
    date.tm_mon = 2;
    date.tm_mday = 2;
    date.tm_hour = 9;
    date.tm_min = 5;
    date.tm_isdst = -1;
    EXPECT_EQ(m_board->GetDeviceChangeDate(), std::mktime(&date));
    EXPECT_EQ(m_board->GetLastCondition(), BoardStatusNone);
}

TEST_F(Z7BoardTest, QueriesDoNotAskThePlatform) {
    sim::set(5, "DESCRIPTION", "changed");
    sim::set(5, "IRQ", 12);
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "Trunk board");
    EXPECT_EQ(m_board->GetIRQ(), 11);
}

TEST_F(Z7BoardTest, StartRebuildsTheRecord) {
    sim::set(5, "DESCRIPTION", "changed");
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "changed");
}

TEST_F(Z7BoardTest, StartedBoardRebuildsTheRecordButRunsItsStagesOnce) {
    m_board->ProcessExternalEvent(BoardStatusStarted);
    m_board->calls.clear();
    sim::set(5, "DESCRIPTION", "changed");
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "changed");
    EXPECT_EQ(m_board->calls, "");
}

TEST_F(Z7BoardTest, NoOtherStatusRebuildsTheRecord) {
    sim::set(5, "DESCRIPTION", "changed");
    for (int const status : {4, 13, 14, 15, 7})
        m_board->ProcessExternalEvent(static_cast<BoardStatusEnum>(status));
    EXPECT_EQ(text(&Board::GetFunctionalDescription), "Trunk board");
}

TEST_F(Z7BoardTest, SerialNumberStaysWhenTheRecordIsRebuilt) {
    sim::set(5, "SERIAL_NUMBER", "other");
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetSerialNumber), "S5");
}

TEST_F(Z7BoardTest, StartClearsTheErrorMessage) {
    m_board->SetErrorMessage("broken");
    EXPECT_EQ(text(&Board::GetErrorMessage), "broken");
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetErrorMessage), "");
}

TEST_F(Z7BoardTest, RepeatedStartLeavesTheErrorMessage) {
    m_board->ProcessExternalEvent(BoardStatusStarted);
    m_board->SetErrorMessage("noticed later");
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(text(&Board::GetErrorMessage), "noticed later");
}

TEST_F(Z7BoardTest, LastConditionIsTheLastPendingStatus) {
    m_board->ProcessExternalEvent(BoardStatusStartPending);
    EXPECT_EQ(m_board->GetLastCondition(), BoardStatusStartPending);
    m_board->ProcessExternalEvent(BoardStatusStopPending);
    EXPECT_EQ(m_board->GetLastCondition(), BoardStatusStopPending);
}

TEST_F(Z7BoardTest, LastConditionEndsWithEveryChangeOfState) {
    for (int const status : {3, 4, 15}) {
        m_board->ProcessExternalEvent(BoardStatusStartPending);
        m_board->ProcessExternalEvent(static_cast<BoardStatusEnum>(status));
        EXPECT_EQ(m_board->GetLastCondition(), BoardStatusNone) << status;
    }
}

TEST_F(Z7BoardTest, LastConditionOutlivesAnUnknownStatus) {
    m_board->ProcessExternalEvent(BoardStatusStopPending);
    m_board->ProcessExternalEvent(static_cast<BoardStatusEnum>(7));
    EXPECT_EQ(m_board->GetLastCondition(), BoardStatusStopPending);
}

TEST_F(Z7BoardTest, EveryStatusAsksForBothFirstAndForTheFirstAgainAtTheEnd) {
    for (int const status : {3, 4, 7, 13, 14, 15}) {
        m_board->queries.clear();
        EXPECT_EQ(m_board->ProcessExternalEvent(static_cast<BoardStatusEnum>(status)), -1);
        EXPECT_EQ(m_board->queries.substr(0, 17), "status secondary ") << status;
        EXPECT_TRUE(m_board->queries.ends_with(" status ")) << m_board->queries;
    }
}

TEST_F(Z7BoardTest, NewListenerLearnsThePresentStatusFirst) {
    m_board->status = BoardStatusStarted;
    EXPECT_EQ(m_board->AddBoardStatusListener(&m_log), -1);
    EXPECT_EQ(m_log.statusesOf(m_handle), (std::vector<int>{BoardStatusStarted}));
}

TEST_F(Z7BoardTest, OtherListenersHearNothingOfANewListener) {
    m_board->AddBoardStatusListener(&m_log);
    m_log.clear();
    StatusLog second;
    m_board->AddBoardStatusListener(&second);
    EXPECT_TRUE(m_log.statuses().empty());
}

TEST_F(Z7BoardTest, ListenerAddedAgainLearnsTheStatusAgainButIsCalledOnce) {
    m_board->AddBoardStatusListener(&m_log);
    m_board->AddBoardStatusListener(&m_log);
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(m_log.statuses(), (std::vector<int>{4, 4, 3}));
}

TEST_F(Z7BoardTest, ListenersAreToldWithThisBoard) {
    m_board->AddBoardStatusListener(&m_log);
    m_board->ProcessExternalEvent(BoardStatusStarted);
    EXPECT_EQ(m_log.statusesOf(m_handle), (std::vector<int>{4, 3}));
}

TEST_F(Z7BoardTest, BaseHasNoFeaturesOfItsOwn) {
    EXPECT_EQ(m_board->Z7Board::create_ipethernet_feature(), 0);
    EXPECT_EQ(m_board->Z7Board::create_extended_features(), 0);
    EXPECT_EQ(m_board->Z7Board::destroy_extended_features(), 0);
    EXPECT_EQ(m_board->GetFeatureListSize(), 0);
}

TEST_F(Z7BoardTest, NothingIsLeftOfABoard) {
    m_handle = {};
    int const before = ReferenceTable::get_instance()->referenced_objects();
    {
        ReferenceCounter<Board> const board(new RecordingBoard(5));
        static_cast<RecordingBoard*>(board.get())->ProcessExternalEvent(BoardStatusStarted);
    }
    EXPECT_EQ(ReferenceTable::get_instance()->referenced_objects(), before);
}

TEST_F(Z7BoardTest, OperationsKeepTheirSlots) {
    int slot = slotOf(&Z7Board::NotifyBoardStatusListeners);
    EXPECT_EQ(slot, 22);
    EXPECT_EQ(slotOf(&Z7Board::ProcessExternalEvent), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::PingBoard), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::SetStatus), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::SetSecondaryStatus), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::StartStage1), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::StartStage2), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::StartStage3), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::StopBoard), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::create_ipethernet_feature), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::create_extended_features), ++slot);
    EXPECT_EQ(slotOf(&Z7Board::destroy_extended_features), ++slot);
}

/// The effect of a status on a board in each state: every combination once.
struct Transition {
    int status;
    int secondary;
    int delivered;
    char const* calls;
    bool dated; ///< whether the device change date becomes now
};

constexpr char const* kStart = "stage1 stage2 stage3 features ipethernet status3 tell3";
constexpr char const* kStartAfterFailure =
    "stage1 stage2 stage3 features ipethernet status3 secondary0 tell3";
constexpr char const* kStop = "status4 tell4 stop nofeatures";

constexpr Transition kTransitions[] = {
    {4, 0, 3, kStart, true},
    {4, 15, 3, kStartAfterFailure, true},
    {3, 0, 3, "", false},
    {3, 15, 3, "secondary0 tell0", true},
    {13, 0, 3, kStart, true},

    {3, 0, 4, kStop, true},
    {3, 15, 4, kStop, true},
    {4, 0, 4, "", false},
    {4, 15, 4, "", false},
    {13, 0, 4, kStop, true},

    {3, 0, 15, "status4 stop nofeatures secondary15 tell15", true},
    {3, 15, 15, "status4 stop nofeatures tell4", true},
    {4, 0, 15, "secondary15 tell15", true},
    {4, 15, 15, "", false},
    {13, 15, 15, "status4 stop nofeatures tell4", true},

    {3, 0, 13, "", false},
    {3, 15, 13, "", false},
    {4, 0, 13, "", false},
    {4, 15, 13, "", false},
    {3, 0, 14, "", false},
    {3, 15, 14, "", false},
    {4, 0, 14, "", false},
    {4, 15, 14, "", false},

    {3, 0, 7, "", false},
    {4, 15, 7, "", false},
    {3, 0, 0, "", false},
    {3, 0, 9, "", false},
    {4, 0, 10, "", false},
};

class Z7BoardTransitionTest : public testing::TestWithParam<Transition> {};

TEST_P(Z7BoardTransitionTest, StatusDoesItsStepsInOrder) {
    auto const& transition = GetParam();
    sim::load({sim::board(5, "S5")});
    auto* const board = new RecordingBoard(5);
    ReferenceCounter<Board> const handle(board);
    board->status = static_cast<BoardStatusEnum>(transition.status);
    board->secondary = static_cast<BoardStatusEnum>(transition.secondary);
    board->SetDeviceChangeDate(1);
    long const before = std::time(nullptr);

    EXPECT_EQ(board->ProcessExternalEvent(static_cast<BoardStatusEnum>(transition.delivered)), -1);

    EXPECT_EQ(board->calls, transition.calls);
    if (transition.dated)
        EXPECT_GE(board->GetDeviceChangeDate(), before);
    else
        EXPECT_EQ(board->GetDeviceChangeDate(), 1);
}

INSTANTIATE_TEST_SUITE_P(EveryState, Z7BoardTransitionTest, testing::ValuesIn(kTransitions),
                         [](auto const& row) {
                             return "Status" + std::to_string(row.param.delivered) + "In" +
                                    std::to_string(row.param.status) + "And" +
                                    std::to_string(row.param.secondary);
                         });

} // namespace
