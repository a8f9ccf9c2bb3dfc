// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/EntityStates.h"

#include <algorithm>
#include <array>
#include <map>
#include <memory>
#include <random>

#include <gmock/gmock.h>

#include "agent/readers/Answers.h"
#include "board/Board.h"
#include "board/DS1LineDevice.h"

namespace kvloamd {
namespace {

using ::testing::IsEmpty;
using ::testing::SizeIs;

EntityState stateOf(int status, int secondaryStatus = BoardStatusNone) {
    BoardRow board;
    board.status = status;
    board.secondaryStatus = secondaryStatus;
    return boardState(board, false);
}

EntityState portOf(std::optional<int> operStatus, std::optional<int> lineStatus = std::nullopt) {
    InterfaceRow interface;
    interface.operStatus = operStatus;
    LineRow line;
    line.lineStatus = lineStatus;
    return portState(interface, &line);
}

unsigned alarmOf(int lineStatus) {
    return static_cast<unsigned char>(portOf(1, lineStatus).alarm);
}

TEST(BoardStateTest, StartedBoardWorks) {
    EntityState const state = stateOf(BoardStatusStarted);
    EXPECT_EQ(state.admin, AdminState::Unlocked);
    EXPECT_EQ(state.oper, OperState::Enabled);
    EXPECT_EQ(state.alarm, 0);
}

TEST(BoardStateTest, StoppedBoardIsLockedAndCannotTellWhetherItWorks) {
    EntityState const state = stateOf(BoardStatusStopped);
    EXPECT_EQ(state.admin, AdminState::Locked);
    EXPECT_EQ(state.oper, OperState::Unknown);
    EXPECT_EQ(state.alarm, 0);
}

TEST(BoardStateTest, BoardHasNoRoomForAnotherEntityAndNoStandbyRole) {
    for (int const status : {BoardStatusNone, BoardStatusStarted, BoardStatusStopped,
                             BoardStatusStartPending, BoardStatusStopPending}) {
        EXPECT_EQ(stateOf(status).usage, UsageState::Busy) << status;
        EXPECT_EQ(stateOf(status).standby, StandbyState::ProvidingService) << status;
    }
}

TEST(BoardStateTest, FaultIsAnAlarmOfNoKnownSeverity) {
    BoardRow board;
    board.status = BoardStatusStarted;
    EntityState const state = boardState(board, true);
    EXPECT_EQ(state.alarm, '\x02');
    EXPECT_EQ(state.oper, OperState::Enabled);
}

TEST(BoardStateTest, FailedBoardWithAFaultHasBothAlarms) {
    BoardRow board;
    board.secondaryStatus = BoardStatusFailed;
    EXPECT_EQ(boardState(board, true).alarm, '\x22');
}

TEST(BoardStateTest, BoardThatIsToStopWorksYet) {
    EntityState const state = stateOf(BoardStatusStopPending);
    EXPECT_EQ(state.admin, AdminState::ShuttingDown);
    EXPECT_EQ(state.oper, OperState::Enabled);
}

TEST(BoardStateTest, BoardThatIsToStartCannotTellYetWhetherItWorks) {
    EntityState const state = stateOf(BoardStatusStartPending);
    EXPECT_EQ(state.admin, AdminState::Unlocked);
    EXPECT_EQ(state.oper, OperState::Unknown);
}

TEST(BoardStateTest, FailedBoardIsCriticalAndNobodyHasLockedIt) {
    EntityState const state = stateOf(BoardStatusStopped, BoardStatusFailed);
    EXPECT_EQ(state.admin, AdminState::Unknown);
    EXPECT_EQ(state.oper, OperState::Disabled);
    EXPECT_EQ(static_cast<unsigned char>(state.alarm), kAlarmCritical);
}

TEST(BoardStateTest, BoardWithoutStatusIsUnknown) {
    EntityState const state = stateOf(BoardStatusNone);
    EXPECT_EQ(state.admin, AdminState::Unknown);
    EXPECT_EQ(state.oper, OperState::Unknown);
}

TEST(PortStateTest, OperStateIsThatOfTheInterface) {
    for (auto const& [status, state] : {std::pair{1, OperState::Enabled},
                                        {2, OperState::Disabled},
                                        {3, OperState::Testing},
                                        {4, OperState::Unknown},
                                        {5, OperState::Enabled},
                                        {6, OperState::Unknown},
                                        {7, OperState::Unknown}})
        EXPECT_EQ(portOf(status).oper, state) << status;
    EXPECT_EQ(portOf(std::nullopt).oper, OperState::Unknown);
}

TEST(PortStateTest, LineStatusTellsWhatTheInterfaceDoesNot) {
    EXPECT_EQ(portOf(std::nullopt, DS1LineStatusNoAlarm).oper, OperState::Enabled);
    EXPECT_EQ(portOf(std::nullopt, DS1LineStatusRcvAIS).oper, OperState::Disabled);
    EXPECT_EQ(portOf(std::nullopt, DS1LineStatusLossOfSignal).oper, OperState::Disabled);
    EXPECT_EQ(portOf(std::nullopt, DS1LineStatusLoopbackState).oper, OperState::Unknown);
    EXPECT_EQ(portOf(1, DS1LineStatusLossOfSignal).oper, OperState::Enabled);
}

TEST(PortStateTest, PortThatWasTakenDownWorksAsFarAsItsLineKnows) {
    InterfaceRow interface;
    interface.adminStatus = kDown;
    interface.operStatus = kDown;
    LineRow line;
    auto const operWith = [&](std::optional<int> lineStatus) {
        line.lineStatus = lineStatus;
        EXPECT_EQ(portState(interface, &line).admin, AdminState::Locked);
        return portState(interface, &line).oper;
    };
    EXPECT_EQ(operWith(std::nullopt), OperState::Unknown);
    EXPECT_EQ(operWith(DS1LineStatusNoAlarm), OperState::Enabled);
    EXPECT_EQ(operWith(DS1LineStatusLossOfSignal), OperState::Disabled);
    EXPECT_EQ(portState(interface, nullptr).oper, OperState::Unknown);
}

TEST(PortStateTest, PortHasNoRoomForAnotherEntityAndNoStandbyRole) {
    for (int const status : {1, 2, 3, 4, 5, 6, 7}) {
        EXPECT_EQ(portOf(status).usage, UsageState::Busy) << status;
        EXPECT_EQ(portOf(status).standby, StandbyState::ProvidingService) << status;
    }
}

TEST(PortStateTest, AdminStateIsThatOfTheInterface) {
    InterfaceRow interface;
    EXPECT_EQ(portState(interface, nullptr).admin, AdminState::Unknown);
    for (auto const& [status, state] :
         {std::pair{1, AdminState::Unlocked}, {2, AdminState::Locked}, {3, AdminState::Unknown}}) {
        interface.adminStatus = status;
        EXPECT_EQ(portState(interface, nullptr).admin, state);
    }
}

TEST(PortStateTest, AlarmsAreOfTheSeverityOfTheirCause) {
    EXPECT_EQ(alarmOf(DS1LineStatusNoAlarm), 0U);
    EXPECT_EQ(alarmOf(DS1LineStatusLossOfSignal), kAlarmCritical);
    EXPECT_EQ(alarmOf(DS1LineStatusLossOfFrame), kAlarmCritical);
    EXPECT_EQ(alarmOf(DS1LineStatusRcvAIS), kAlarmMajor);
    EXPECT_EQ(alarmOf(DS1LineStatusT16AIS), kAlarmMajor);
    EXPECT_EQ(alarmOf(DS1LineStatusRcvPayloadAIS), kAlarmMajor);
    EXPECT_EQ(alarmOf(DS1LineStatusUnavailSigState), kAlarmMajor);
    EXPECT_EQ(alarmOf(DS1LineStatusRcvFarEndLOF), kAlarmMinor);
    EXPECT_EQ(alarmOf(DS1LineStatusRcvFarEndLOMF), kAlarmMinor);
    EXPECT_EQ(alarmOf(DS1LineStatusDs2PerfThreshold), kAlarmWarning);
    EXPECT_EQ(alarmOf(DS1LineStatusOtherFailure), kAlarmIndeterminate);
    EXPECT_EQ(alarmOf(DS1LineStatusNetEquipOOS), kAlarmIndeterminate);
    EXPECT_EQ(alarmOf(DS1LineStatusRcvFarEndLOF | DS1LineStatusLossOfSignal),
              kAlarmMinor | kAlarmCritical);
}

TEST(PortStateTest, WhatALineSendsOrIsTestedWithIsNoAlarm) {
    EXPECT_EQ(alarmOf(DS1LineStatusXmtFarEndLOF | DS1LineStatusXmtAIS | DS1LineStatusLoopbackState |
                      DS1LineStatusXmtFarEndLOMF | DS1LineStatusRcvTestCode),
              0U);
}

TEST(PortStateTest, PortThatTellsOfNoAlarmsMayHaveSome) {
    InterfaceRow const ethernet;
    EXPECT_EQ(static_cast<unsigned char>(portState(ethernet, nullptr).alarm), kAlarmUnknown);
    EXPECT_EQ(static_cast<unsigned char>(portOf(1, std::nullopt).alarm), kAlarmUnknown);
    EXPECT_EQ(alarmOf(0), kAlarmUnknown);
}

class EntityStatesTest : public ::testing::Test {
  protected:
    EntityStatesTest() {
        m_entity.entity = 17;
        m_entity.boardIndex = 1;
        m_board.boardIndex = 1;
        m_board.status = BoardStatusStarted;
    }
    Rows<EntityStateRow> read() { return m_states.read({m_entity}, {m_board}, {}, m_faults); }
    std::string readChanged() {
        auto const rows = read();
        EXPECT_THAT(rows, SizeIs(1));
        return rows.empty() ? "" : rows[0].changed;
    }

    long m_now = 1'000'000'000;
    PhysicalRow m_entity;
    BoardRow m_board;
    std::vector<FaultRow> m_faults;
    EntityStates m_states{[this] { return m_now; }};
};

TEST_F(EntityStatesTest, StateThatNeverChangedIsSinceTheStart) {
    m_now += 5;
    EXPECT_EQ(readChanged(), dateOctets(1'000'000'000));
    m_now += 5;
    EXPECT_EQ(readChanged(), dateOctets(1'000'000'000));
}

TEST_F(EntityStatesTest, ChangeOfStateIsDated) {
    read();
    m_now += 60;
    m_board.status = BoardStatusStopped;
    EXPECT_EQ(readChanged(), dateOctets(1'000'000'060));
    m_now += 60;
    EXPECT_EQ(readChanged(), dateOctets(1'000'000'060));
}

TEST_F(EntityStatesTest, FaultOfABoardIsItsAlarmAndNoOthers) {
    m_faults.push_back({2, 17, 2, 0, "", 1});
    EXPECT_EQ(read().at(0).state.alarm, 0);
    m_faults.insert(m_faults.begin(), {1, 17, 1, 0, "", 1});
    EXPECT_EQ(read().at(0).state.alarm, '\x02');
}

TEST_F(EntityStatesTest, ProcessorHasOnlyTheStatesThatNeedNoPlatform) {
    PhysicalRow processor;
    processor.entity = 18;
    processor.physicalClass = PhysicalClass::Cpu;
    auto const rows = m_states.read({m_entity, processor}, {m_board}, {}, {});
    ASSERT_THAT(rows, SizeIs(2));
    EXPECT_EQ(rows[1].entity, 18U);
    EXPECT_EQ(rows[1].state.admin, AdminState::Unknown);
    EXPECT_EQ(rows[1].state.oper, OperState::Unknown);
    EXPECT_EQ(rows[1].state.usage, UsageState::Busy);
    EXPECT_EQ(static_cast<unsigned char>(rows[1].state.alarm), kAlarmUnknown);
    EXPECT_EQ(rows[1].state.standby, StandbyState::ProvidingService);
}

TEST_F(EntityStatesTest, EntityThatComesIsInItsStateSinceThen) {
    read();
    EXPECT_THAT(m_states.read({}, {}, {}, {}), IsEmpty());
    m_now += 60;
    EXPECT_EQ(readChanged(), dateOctets(1'000'000'060));
}

/// Puts a row in its place, or takes out the one of this index; the others stay where they are.
template <class Row>
void put(Rows<Row>& rows, Row const& row, bool isThere) {
    auto const shared = std::make_shared<Row const>(row);
    std::array<Row const*, 1> const place{shared.get()};
    std::array<std::shared_ptr<void const>, 1> const owner{shared};
    if (isThere)
        rows.exchange(place, place, owner);
    else
        rows.exchange(place, {}, {});
}

TEST(EntityStatesModelTest, SharedRowsHaveTheStatesAndDatesOfAllRows) {
    std::mt19937 random(20261122);
    auto const number = [&](int least, int most) {
        return std::uniform_int_distribution(least, most)(random);
    };
    long now = 1'000'000'000;
    EntityStates states([&] { return now; });
    Rows<PhysicalRow> entities;
    Rows<BoardRow> boards;
    InterfaceRows interfaces;
    std::vector<FaultRow> faults;
    std::map<std::uint32_t, EntityStateRow> model;
    std::size_t most = 0;
    for (int step = 0; step < 5'000; ++step) {
        auto const board = static_cast<std::uint32_t>(number(1, 5));
        bool const isThere = number(0, 4) != 0;
        switch (number(0, 6)) {
        case 0: {
            BoardRow row;
            row.boardIndex = board;
            row.status = number(0, 1) != 0 ? BoardStatusStarted : BoardStatusStopped;
            put(boards, row, isThere);
            break;
        }
        case 1: {
            InterfaceRow row;
            row.ifIndex = 100 + board;
            row.operStatus = number(1, 2);
            put(interfaces.interfaces, row, isThere);
            break;
        }
        case 2: {
            LineRow row;
            row.ifIndex = 100 + board;
            row.lineStatus = number(0, 1) != 0 ? DS1LineStatusNoAlarm : DS1LineStatusLossOfSignal;
            put(interfaces.lines, row, isThere);
            break;
        }
        case 3: {
            PhysicalRow row;
            row.entity = board * 10;
            row.boardIndex = board;
            put(entities, row, isThere);
            break;
        }
        case 4: {
            PhysicalRow row;
            row.entity = board * 10 + 1;
            row.ifIndex = 100 + board;
            row.physicalClass = PhysicalClass::Port;
            put(entities, row, isThere);
            break;
        }
        case 5:
            faults.assign(isThere ? 1 : 0, FaultRow{board, 17, 1, 0, "", 1});
            break;
        default:
            break;
        }
        ++now;
        auto const rows = states.read(entities, boards, interfaces, faults);
        EntityStates anew([&] { return now; });
        auto const expected = anew.read(entities, boards, interfaces, faults);
        ASSERT_EQ(rows.size(), expected.size()) << "step " << step;
        std::map<std::uint32_t, EntityStateRow> dated;
        for (std::size_t i = 0; i < rows.size(); ++i) {
            EntityStateRow row = expected[i];
            auto const former = model.find(row.entity);
            bool const same = former != model.end() && former->second.state == row.state;
            row.changed = same ? former->second.changed : dateOctets(step == 0 ? now - 1 : now);
            ASSERT_EQ(rows[i], row) << "step " << step;
            dated[row.entity] = row;
        }
        model = std::move(dated);
        most = std::max(most, model.size());
    }
    EXPECT_GT(most, 6U);
}

} // namespace
} // namespace kvloamd
