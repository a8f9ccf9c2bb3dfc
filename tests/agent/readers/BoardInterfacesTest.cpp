// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardInterfaces.h"

#include <gmock/gmock.h>

#include "agent/rows/IndexKey.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeLines.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using ::testing::UnorderedElementsAre;

class BoardInterfacesTest : public ::testing::Test {
  protected:
    /// Gives the board a feature, which it keeps.
    void add(Feature* feature) { m_board->AddFeature(ReferenceCounter<Feature>(feature)); }
    FakeLine& addLine(std::string name, std::string circuit = "") {
        auto* const line = new FakeLine(std::move(name), std::move(circuit));
        add(new FakeLineFeature({line}));
        return *line;
    }
    FakeHistory& addHistory(FakeLine& line) {
        auto* const history = new FakeHistory;
        line.history = ReferenceCounter<DS1IntervalTable>(history);
        return *history;
    }
    static std::vector<ISDNBChannel*> bearersOn(FakeLine* line, std::vector<int> const& slots) {
        std::vector<ISDNBChannel*> bearers;
        for (int const slot : slots)
            bearers.push_back(
                new OnLine<FakeBChannel>(line, ("B" + std::to_string(slot)).c_str(), 1, slot));
        return bearers;
    }
    std::vector<std::optional<int>> bearerNumbers() {
        std::vector<std::optional<int>> numbers;
        for (BearerRow const& row : read().bearers)
            numbers.push_back(row.channelNumber);
        return numbers;
    }
    BoardInterfaceRows read() {
        return readInterfaces(*m_board.get(), m_toTicks, m_histories).rows;
    }
    LineRow readLine() {
        auto rows = read();
        EXPECT_THAT(rows.lines, SizeIs(1));
        return rows.lines.empty() ? LineRow{} : rows.lines.front();
    }

    ToTicks const m_toTicks = [](long seconds) { return static_cast<std::uint32_t>(seconds); };
    LineHistories m_histories;
    ReferenceCounter<Board> m_board{new FakeBoard};
};

TEST_F(BoardInterfacesTest, LinesAreReadOnceThoughTheyAreInterfacesToo) {
    addLine("one");
    addLine("two");
    auto const found = readInterfaces(*m_board.get(), m_toTicks, m_histories);
    EXPECT_THAT(found.keys,
                ElementsAre(IndexKey{IndexKind::Line, "one"}, IndexKey{IndexKind::Line, "two"}));
    EXPECT_THAT(found.rows.interfaces, SizeIs(2));
}

TEST_F(BoardInterfacesTest, LinesArePortsAndChannelsAreNot) {
    addLine("one");
    add(new FakeISDNFeature({new FakeDChannel("D", 1, 1, "one")}, {new FakeBChannel("B", 1)}));
    auto const rows = read();
    EXPECT_THAT(rows.interfaces, SizeIs(4));
    ASSERT_THAT(rows.ports, SizeIs(1));
    EXPECT_EQ(rows.ports[0].ifIndex, rows.lines[0].ifIndex);
    EXPECT_EQ(rows.ports[0].key, (IndexKey{IndexKind::Line, "one"}));
}

TEST_F(BoardInterfacesTest, LinesOfOneNameAreToldApart) {
    addLine("same");
    addLine("same");
    EXPECT_THAT(
        readInterfaces(*m_board.get(), m_toTicks, m_histories).keys,
        ElementsAre(IndexKey{IndexKind::Line, "same"}, IndexKey{IndexKind::Line, "same#2"}));
}

TEST_F(BoardInterfacesTest, WhatALineDoesNotSupportIsNotKnown) {
    addLine("one");
    LineRow const line = readLine();
    EXPECT_EQ(line.lineStatus, std::nullopt);
    EXPECT_EQ(line.lineLength, std::nullopt);
    EXPECT_EQ(line.statusLastChange, std::nullopt);
    EXPECT_EQ(line.timeElapsed, std::nullopt);
    EXPECT_FALSE(line.keepsHistory());
}

TEST_F(BoardInterfacesTest, NumbersThatTheStandardDoesNotHaveAreLeftOut) {
    FakeLine& line = addLine("one");
    for (int const illegal : {0, 200000, -3}) {
        line.setUp = line.lineType = line.lineStatus = illegal;
        LineRow const row = readLine();
        for (auto const field :
             {&LineRow::lineType, &LineRow::lineCoding, &LineRow::sendCode,
              &LineRow::loopbackConfig, &LineRow::lineStatus, &LineRow::signalMode,
              &LineRow::transmitClockSource, &LineRow::fdl, &LineRow::loopbackStatus,
              &LineRow::channelization, &LineRow::lineMode, &LineRow::lineBuildOut})
            EXPECT_EQ(row.*field, std::nullopt) << illegal;
    }
    line.setUp = 2;
    line.lineType = 15; // between the others, and no value
    EXPECT_EQ(readLine().lineBuildOut, 2);
    EXPECT_EQ(readLine().lineType, std::nullopt);
}

TEST_F(BoardInterfacesTest, ImpedanceThatALineDoesNotSayIsNotApplicable) {
    addLine("one");
    EXPECT_EQ(readLine().lineImpedance, 1);
}

TEST_F(BoardInterfacesTest, TimeSlotsOfALineAreMappedToTheirChannels) {
    FakeLine& line = addLine("one");
    add(new FakeISDNFeature({}, bearersOn(&line, {1, 31})));
    auto const rows = read();
    ASSERT_THAT(rows.ds0Channels, SizeIs(2));
    EXPECT_EQ(rows.ds0Channels[1].line, 1U);
    EXPECT_EQ(rows.ds0Channels[1].timeSlot, 31U);
    EXPECT_EQ(rows.ds0Channels[1].channel, 3U);
}

TEST_F(BoardInterfacesTest, HistoryIsReadFromTheRunningIntervalBackwards) {
    FakeHistory& history = addHistory(addLine("one"));
    history.close(5);
    history.close(7);
    history.run(1, 300);
    LineRow const line = readLine();
    EXPECT_EQ(line.timeElapsed, 300);
    ASSERT_EQ(line.closedIntervals(), 2U);
    EXPECT_EQ(line.running[0], 1);
    EXPECT_EQ(line.closed->counts[0][0], 7);
    EXPECT_EQ(line.closed->counts[1][0], 5);
}

TEST_F(BoardInterfacesTest, TotalLeavesOutTheRunningInterval) {
    FakeHistory& history = addHistory(addLine("one"));
    history.close(5);
    history.close(7);
    history.run(100, 300);
    EXPECT_EQ(readLine().closed->total[0], 12);
}

TEST_F(BoardInterfacesTest, TotalOfWhatIsNotSupportedIsNotKnown) {
    FakeHistory& history = addHistory(addLine("one"));
    history.knowsDegradedMinutes = false;
    history.close(5);
    history.close(7);
    LineRow const line = readLine();
    EXPECT_LT(line.closed->total[8], 0);
    EXPECT_EQ(line.closed->total[0], 12);
}

TEST_F(BoardInterfacesTest, IntervalThatIsAboutToBeClosedHasLasted899Seconds) {
    addHistory(addLine("one")).run(0, 900);
    EXPECT_EQ(readLine().timeElapsed, 899);
}

TEST_F(BoardInterfacesTest, ChannelsLieAboveTheLineThatTheirSignallingNames) {
    addLine("one");
    addLine("two", "circuit 2");
    add(new FakeISDNFeature(
        {new FakeDChannel("D1", 3, 1, "one"), new FakeDChannel("D2", 3, 2, "circuit 2")},
        {new FakeBChannel("B1", 1), new FakeBChannel("B2", 1), new FakeBChannel("B3", 1)}));
    // Numbers on the board: lines 1 and 2, signalling 3 and 4, bearers 5 to 7, data links 8 and 9.
    EXPECT_THAT(read().stack,
                UnorderedElementsAre(StackRow{3, 8}, StackRow{8, 1}, StackRow{4, 9}, StackRow{9, 2},
                                     StackRow{5, 1}, StackRow{6, 2}, StackRow{7, 2}));
}

TEST_F(BoardInterfacesTest, BearersThatDoNotAddUpLieAboveNothing) {
    addLine("one");
    add(new FakeISDNFeature({new FakeDChannel("D1", 3, 5, "one")}, {new FakeBChannel("B1", 1)}));
    EXPECT_THAT(read().stack, UnorderedElementsAre(StackRow{2, 4}, StackRow{4, 1}));
}

TEST_F(BoardInterfacesTest, ChannelsOfAnUnknownLineLieAboveNoLine) {
    addLine("one");
    add(new FakeISDNFeature({new FakeDChannel("D1", 3, 1, "other")}, {new FakeBChannel("B1", 1)}));
    EXPECT_THAT(read().stack, ElementsAre(StackRow{2, 4}));
}

TEST_F(BoardInterfacesTest, EverySignallingChannelHasADataLink) {
    add(new FakeISDNFeature({new FakeDChannel("D1", ISDNDChannelStatusL1Active, 0, "")}, {}));
    auto const rows = read();
    ASSERT_THAT(rows.lapds, SizeIs(1));
    EXPECT_EQ(rows.lapds[0].ifIndex, 2U);
    EXPECT_EQ(rows.lapds[0].operStatus, ISDNDChannelStatusL1Active);
    EXPECT_EQ(rows.interfaces[1].type, 77);
    EXPECT_EQ(rows.interfaces[1].speed, 64000U);
    EXPECT_EQ(rows.interfaces[1].name, "D1-lapd");
}

TEST_F(BoardInterfacesTest, LineInThePlaceOfACallingAddressIsNoAddress) {
    addLine("one");
    add(new FakeISDNFeature(
        {new FakeDChannel("D1", 3, 1, "one"), new FakeDChannel("D2", 3, 1, "555 0100")}, {}));
    auto const rows = read();
    ASSERT_THAT(rows.signalling, SizeIs(2));
    EXPECT_EQ(rows.signalling[0].callingAddress, "");
    EXPECT_EQ(rows.signalling[1].callingAddress, "555 0100");
}

TEST_F(BoardInterfacesTest, BearersOfAnE1AreNumberedWithoutTheSlotOfItsSignalling) {
    FakeLine& line = addLine("one");
    line.lineType = 5;
    add(new FakeISDNFeature({}, bearersOn(&line, {1, 15, 17, 31})));
    EXPECT_THAT(bearerNumbers(), ElementsAre(1, 15, 16, 30));
}

TEST_F(BoardInterfacesTest, BearersThatUseEverySlotKeepTheirNumbers) {
    FakeLine& line = addLine("one");
    line.lineType = 5;
    add(new FakeISDNFeature({}, bearersOn(&line, {15, 16, 17, 31})));
    // ISDN-MIB has no number 31.
    EXPECT_THAT(bearerNumbers(), ElementsAre(15, 16, 17, std::nullopt));
}

TEST_F(BoardInterfacesTest, BearersOfAT1KeepTheirNumbers) {
    FakeLine& line = addLine("one");
    line.lineType = 2;
    add(new FakeISDNFeature({}, bearersOn(&line, {1, 17, 23})));
    EXPECT_THAT(bearerNumbers(), ElementsAre(1, 17, 23));
}

TEST_F(BoardInterfacesTest, ChannelsLieAboveTheLineThatTheySay) {
    FakeLine& first = addLine("same");
    FakeLine& second = addLine("same");
    add(new FakeISDNFeature(
        {new OnLine<FakeDChannel>(&second, "D1", 3, 1, "same"),
         new OnLine<FakeDChannel>(&first, "D2", 3, 1, "same")},
        {new OnLine<FakeBChannel>(&second, "B1", 1), new OnLine<FakeBChannel>(&first, "B2", 1)}));
    EXPECT_THAT(read().stack, UnorderedElementsAre(StackRow{3, 7}, StackRow{7, 2}, StackRow{4, 8},
                                                   StackRow{8, 1}, StackRow{5, 2}, StackRow{6, 1}));
}

TEST_F(BoardInterfacesTest, BearersThatSayTheirLineNeedNotAddUp) {
    FakeLine& line = addLine("one");
    add(new FakeISDNFeature({},
                            {new OnLine<FakeBChannel>(&line, "B1", 1), new FakeBChannel("B2", 1)}));
    EXPECT_THAT(read().stack, ElementsAre(StackRow{2, 1}));
}

TEST_F(BoardInterfacesTest, BearersThatCannotSayTheirLineFollowTheirSignallingChannel) {
    FakeLine& line = addLine("one");
    add(new FakeISDNFeature({new OnLine<FakeDChannel>(&line, "D1", 3, 1, "other")},
                            {new FakeBChannel("B1", 1)}));
    EXPECT_THAT(read().stack, UnorderedElementsAre(StackRow{2, 4}, StackRow{4, 1}, StackRow{3, 1}));
}

TEST_F(BoardInterfacesTest, ChannelThatSaysNoLineLiesAboveNoLine) {
    addLine("one");
    add(new FakeISDNFeature({new OnLine<FakeDChannel>(nullptr, "D1", 3, 1, "one")},
                            {new OnLine<FakeBChannel>(nullptr, "B1", 1)}));
    EXPECT_THAT(read().stack, ElementsAre(StackRow{2, 4}));
}

TEST_F(BoardInterfacesTest, ChannelThatSaysALineOfAnotherBoardLiesAboveNothing) {
    addLine("one");
    add(new FakeISDNFeature({}, {new OnLine<FakeBChannel>(new FakeLine("one", ""), "B1", 1)}));
    EXPECT_THAT(read().stack, IsEmpty());
}

TEST_F(BoardInterfacesTest, NonsensicalNumberOfBearersIsSurvived) {
    addLine("one");
    add(new FakeISDNFeature({new FakeDChannel("D1", 3, 2147483647, "one")},
                            {new FakeBChannel("B1", 1)}));
    EXPECT_THAT(read().bearers, SizeIs(1));
}

TEST_F(BoardInterfacesTest, CallOfABearerIsRead) {
    auto* const bearer = new FakeCallingChannel("B1", ISDNBChannelStatusActive);
    std::strcpy(bearer->call.peerAddress, "5550199");
    bearer->call.origin = 3;
    bearer->call.informationType = 9;
    bearer->call.multirate = 1;
    bearer->call.setupTime = 70;
    bearer->call.connectTime = 72;
    bearer->call.chargedUnits = 12;
    add(new FakeISDNFeature({}, {bearer}));
    CallRow const call = read().bearers.at(0).call;
    EXPECT_EQ(call.peerAddress, "5550199");
    EXPECT_EQ(call.peerSubAddress, "");
    EXPECT_EQ(call.origin, 3);
    EXPECT_EQ(call.informationType, 9);
    EXPECT_EQ(call.multirate, 1);
    EXPECT_EQ(call.setupTime, 70U);
    EXPECT_EQ(call.connectTime, 72U);
    EXPECT_TRUE(call.connected);
    EXPECT_EQ(call.chargedUnits, 12U);
}

TEST_F(BoardInterfacesTest, CallWithNumbersThatTheStandardDoesNotHaveIsUnknown) {
    auto* const bearer = new FakeCallingChannel("B1", ISDNBChannelStatusActive);
    bearer->call.origin = 5;
    bearer->call.informationType = 0;
    bearer->call.multirate = 3;
    add(new FakeISDNFeature({}, {bearer}));
    CallRow const call = read().bearers.at(0).call;
    EXPECT_EQ(call.origin, 1);
    EXPECT_EQ(call.informationType, 1);
    EXPECT_EQ(call.multirate, 2);
}

TEST_F(BoardInterfacesTest, AddressThatIsNotTerminatedIsBounded) {
    auto* const bearer = new FakeCallingChannel("B1", ISDNBChannelStatusActive);
    std::memset(bearer->call.peerAddress, '5', sizeof bearer->call.peerAddress);
    add(new FakeISDNFeature({}, {bearer}));
    EXPECT_EQ(read().bearers.at(0).call.peerAddress, std::string(64, '5'));
}

TEST_F(BoardInterfacesTest, CountsOfASignallingChannelAreSharedWithItsDataLink) {
    auto* const channel = new FakeCountingChannel("D1", ISDNDChannelStatusL2Active, 0, "");
    channel->counts = {1, 2, 3, 4, 5, 6, 7};
    add(new FakeISDNFeature({channel}, {}));
    auto const rows = read();
    EXPECT_EQ(rows.signalling.at(0).inCalls, 1U);
    EXPECT_EQ(rows.signalling.at(0).chargedUnits, 5U);
    EXPECT_EQ(rows.signalling.at(0).callingSubAddress, "sub");
    EXPECT_EQ(rows.lapds.at(0).peerSabme, 6U);
    EXPECT_EQ(rows.lapds.at(0).recvdFrmr, 7U);
}

TEST_F(BoardInterfacesTest, CountsThatAChannelDoesNotKnowAreLeftOut) {
    auto* const silent = new FakeCountingChannel("D1", ISDNDChannelStatusL2Active, 0, "");
    silent->result = 1;
    add(new FakeISDNFeature({silent, new FakeDChannel("D2", ISDNDChannelStatusL2Active, 0, "")},
                            {}));
    auto const rows = read();
    for (std::size_t i = 0; i < 2; ++i) {
        EXPECT_EQ(rows.signalling.at(i).inCalls, std::nullopt);
        EXPECT_EQ(rows.lapds.at(i).peerSabme, std::nullopt);
    }
}

TEST_F(BoardInterfacesTest, BearersNameWhatSignalsForThem) {
    FakeLine& line = addLine("one");
    add(new FakeISDNFeature({new OnLine<FakeDChannel>(&line, "D1", 3, 1, "")},
                            {new OnLine<FakeBChannel>(&line, "B1", 1)}));
    EXPECT_EQ(read().bearers.at(0).signalling, 2U);
}

TEST_F(BoardInterfacesTest, BearerOfAnUnknownLineHasNoSignallingChannel) {
    addLine("one");
    add(new FakeISDNFeature({new FakeDChannel("D1", 3, 5, "one")}, {new FakeBChannel("B1", 1)}));
    EXPECT_EQ(read().bearers.at(0).signalling, 0U);
}

TEST_F(BoardInterfacesTest, ChannelIsUpWhenItCarriesSomething) {
    add(new FakeISDNFeature({new FakeDChannel("D1", ISDNDChannelStatusL1Active, 0, ""),
                             new FakeDChannel("D2", ISDNDChannelStatusL2Active, 0, "")},
                            {new FakeBChannel("B1", ISDNBChannelStatusConnecting),
                             new FakeBChannel("B2", ISDNBChannelStatusConnected),
                             new FakeBChannel("B3", 0)}));
    std::vector<std::optional<int>> states;
    for (InterfaceRow const& row : read().interfaces)
        states.push_back(row.operStatus);
    // An unactivated signalling channel waits, and so does an idle bearer channel.
    EXPECT_THAT(states, ElementsAre(kDormant, kUp, kDormant, kUp, std::nullopt, kDormant, kUp));
}

} // namespace
} // namespace kvloamd
