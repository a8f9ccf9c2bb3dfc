// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmEvents.h"

#include <string>
#include <vector>

#include <gmock/gmock.h>

#include "board/DS1LineDevice.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAre;

class AlarmEventsTest : public ::testing::Test {
  protected:
    AlarmEventsTest() {
        BoardRow board;
        board.boardIndex = 1;
        board.serialNumber = "S1";
        board.status = BoardStatusStarted;
        board.pciSlotNumber = 4;
        m_snapshot.boards = {board};
        InterfaceRow interface;
        interface.ifIndex = 1000;
        interface.boardIndex = 1;
        interface.description = "T1 line trunk-1";
        m_snapshot.interfaces.interfaces = {interface};
        LineRow line;
        line.ifIndex = 1000;
        line.lineStatus = DS1LineStatusNoAlarm;
        m_snapshot.interfaces.lines = {line};
        update();
    }
    void update() {
        m_snapshot.begun = Clock::now();
        m_events.update(m_snapshot);
    }
    void announce(BoardStatusEnum status) {
        m_events.boardStatus(1, FakeChassis::fake(m_board), status);
    }
    std::vector<std::string> active() const {
        std::vector<std::string> names;
        for (Alarm const& alarm : m_list.active())
            names.push_back(std::string(alarmKind(alarm.condition.key.kind).name) + " of " +
                            alarm.condition.resource);
        return names;
    }

    LogCapture m_log;
    FakeChassis m_chassis;
    ReferenceCounter<Board> m_board = m_chassis.insert("S1");
    Snapshot m_snapshot;
    AlarmList m_list{{}, [](AlarmEvent, Alarm const&) { return 1U; }};
    AlarmEvents m_events{m_list};
};

TEST_F(AlarmEventsTest, FailureOfABoardIsAnAlarmUntilItStarts) {
    announce(BoardStatusFailed);
    EXPECT_THAT(active(), ElementsAre("boardFailed of board S1"));
    announce(BoardStatusStarted);
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_EQ(m_list.counts().begun, 1U);
    EXPECT_THAT(m_log.take(), HasSubstr("kvloamd: board S1: failed\nkvloamd: board S1: started\n"));
}

TEST_F(AlarmEventsTest, BoardThatIsRemovedWhileItRunsHasGone) {
    announce(BoardStatusRemoved);
    m_snapshot.boards.clear();
    update();
    EXPECT_THAT(active(), ElementsAre("boardGone of board S1"));
}

TEST_F(AlarmEventsTest, BoardThatWasStoppedBeforeItWasRemovedIsNotMissed) {
    announce(BoardStatusStopped);
    announce(BoardStatusRemoved);
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(AlarmEventsTest, BoardThatStopsBecauseItGoesIsMissed) {
    // A snapshot may be read between the two.
    m_snapshot.boards.edit(0).status = BoardStatusStopped;
    update();
    announce(BoardStatusRemoved);
    EXPECT_THAT(active(), ElementsAre("boardGone of board S1"));
}

TEST_F(AlarmEventsTest, BoardThatWasFoundStoppedIsNotMissed) {
    m_snapshot.boards.edit(0).boardIndex = 2;
    m_snapshot.boards.edit(0).status = BoardStatusStopped;
    update();
    m_events.boardStatus(2, FakeChassis::fake(m_board), BoardStatusRemoved);
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(AlarmEventsTest, FailedBoardThatIsRemovedHasGone) {
    announce(BoardStatusStopped);
    announce(BoardStatusFailed);
    announce(BoardStatusRemoved);
    EXPECT_THAT(active(), ElementsAre("boardGone of board S1"));
}

TEST_F(AlarmEventsTest, BoardInTheSlotOfOneThatHasGoneReplacesIt) {
    announce(BoardStatusRemoved);
    m_snapshot.boards.edit(0).serialNumber = "S2";
    update();
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(AlarmEventsTest, ReturningBoardIsNotGone) {
    announce(BoardStatusRemoved);
    announce(BoardStatusAdded);
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(AlarmEventsTest, LineStatusBeginsAndEndsAlarmsBeforeTheNextSnapshot) {
    m_events.lineStatus(1000, DS1LineStatusRcvFarEndLOF | DS1LineStatusUnavailSigState);
    EXPECT_THAT(active(), UnorderedElementsAre("dsx1RcvFarEndLOF of board S1, T1 line trunk-1",
                                               "dsx1UnavailSigState of board S1, T1 line trunk-1"));
    m_events.lineStatus(1000, DS1LineStatusUnavailSigState);
    EXPECT_THAT(active(), ElementsAre("dsx1UnavailSigState of board S1, T1 line trunk-1"));
    m_events.lineStatus(1000, DS1LineStatusNoAlarm);
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_EQ(m_list.counts().begun, 2U);
}

TEST_F(AlarmEventsTest, FailuresThatBeginAndEndTogetherAreOneAlarm) {
    m_events.lineStatus(1000, DS1LineStatusUnavailSigState | DS1LineStatusLossOfFrame |
                                  DS1LineStatusLossOfSignal);
    EXPECT_THAT(active(), ElementsAre("dsx1LossOfSignal of board S1, T1 line trunk-1"));
    m_events.lineStatus(1000, DS1LineStatusNoAlarm);
    m_list.advance(Instant::now());
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_EQ(m_list.counts().raised, 1U);
}

TEST_F(AlarmEventsTest, AlarmThatIsOverBeforeTheNextSnapshotIsCounted) {
    m_events.lineStatus(1000, DS1LineStatusLossOfSignal);
    m_events.lineStatus(1000, DS1LineStatusNoAlarm);
    update();
    ASSERT_EQ(m_list.cleared().size(), 1U);
    EXPECT_EQ(m_list.cleared().front().count, 1U);
}

TEST_F(AlarmEventsTest, LineThatNoSnapshotHasShownIsLeftToTheNextOne) {
    m_events.lineStatus(2000, DS1LineStatusLossOfSignal);
    EXPECT_THAT(active(), IsEmpty());
}

TEST_F(AlarmEventsTest, LoopbackIsLoggedButNoAlarm) {
    m_events.lineStatus(1000, DS1LineStatusLoopbackState);
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_THAT(m_log.take(), HasSubstr("board S1, T1 line trunk-1: line status 128"));
}

TEST_F(AlarmEventsTest, FaultStaysUntilTheSnapshotDoesNotListIt) {
    m_events.fault(true, 1, "S1", 17);
    m_events.fault(true, 1, "S1", 17);
    m_events.fault(false, 1, "S1", 17);
    FaultRow fault;
    fault.boardIndex = 1;
    fault.value = 17;
    m_snapshot.faults.rows = {fault};
    update();
    EXPECT_THAT(active(), ElementsAre("platformFault of board S1"));
    EXPECT_EQ(m_list.active().front().count, 2U);
    m_snapshot.faults.rows.clear();
    update();
    EXPECT_THAT(active(), IsEmpty());
    EXPECT_THAT(m_log.take(), HasSubstr("board S1: fault 17 raised"));
}

} // namespace
} // namespace kvloamd
