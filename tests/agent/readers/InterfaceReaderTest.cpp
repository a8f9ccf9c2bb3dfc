// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceReader.h"

#include <chrono>
#include <limits>
#include <stdexcept>

#include <gmock/gmock.h>

#include "agent/readers/BoardSource.h"
#include "agent/rows/IndexKey.h"
#include "tests/support/FakeBoards.h"
#include "tests/support/FakeEthernet.h"
#include "tests/support/LogCapture.h"

namespace kvloamd {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::SizeIs;

class ThrowingFeature final : public FakeEthernetFeature {
  public:
    ThrowingFeature() : FakeEthernetFeature({}) {}
    ReferenceCounter<KVL::Ethernet> GetFirstEthernet() override {
        throw std::runtime_error("no answer");
    }
};

constexpr int kDate = 1'763'800'000;    // the present, as dates of the host count it
constexpr std::uint32_t kHour = 360000; // as TimeTicks

/// The agent has run for an hour, and no time passes.
class InterfaceReaderTest : public ::testing::Test {
  protected:
    /// Gives the board an Ethernet port, which the board keeps.
    static FakeEthernet& addPort(ReferenceCounter<Board> const& board) {
        auto* const port = new FakeEthernet;
        board->AddFeature(ReferenceCounter<Feature>(
            new FakeEthernetFeature({ReferenceCounter<KVL::Ethernet>(port)})));
        return *port;
    }
    InterfaceRows read() { return m_reader.read(m_source.read()); }
    InterfaceRow readOne() {
        auto const rows = read();
        EXPECT_THAT(rows.interfaces, SizeIs(1));
        return rows.interfaces.empty() ? InterfaceRow{} : rows.interfaces.front();
    }
    std::vector<std::uint32_t> readIndices() {
        std::vector<std::uint32_t> indices;
        for (InterfaceRow const& row : read().interfaces)
            indices.push_back(row.ifIndex);
        return indices;
    }

    FakeChassis m_chassis;
    BoardSource m_source{*m_chassis.manager.get()};
    StableIndices m_indices{1000};
    Clock::time_point const m_now{std::chrono::hours(2)};
    InterfaceReader m_reader{
        *m_chassis.manager.get(),
        m_indices,
        m_now - std::chrono::hours(1),
        nullptr,
        {[this] { return m_now; }, [] { return std::chrono::seconds(kDate); }}};
};

TEST_F(InterfaceReaderTest, BoardWithoutFeaturesHasNoInterfaces) {
    m_chassis.insert("A");
    auto const rows = read();
    EXPECT_THAT(rows.interfaces, IsEmpty());
    EXPECT_THAT(rows.stack, IsEmpty());
}

TEST_F(InterfaceReaderTest, InterfaceKnowsTheSerialNumberOfItsBoard) {
    addPort(m_chassis.insert("A"));
    EXPECT_EQ(readOne().boardSerialNumber, "A");
    addPort(m_chassis.insert("B"));
    EXPECT_EQ(read().interfaces[1].boardSerialNumber, "B");
}

TEST_F(InterfaceReaderTest, WhatAnInterfaceDoesNotSupportIsNotKnown) {
    addPort(m_chassis.insert("A"));
    InterfaceRow const row = readOne();
    EXPECT_EQ(row.type, 6);
    EXPECT_EQ(row.mtu, std::nullopt);
    EXPECT_EQ(row.speed, std::nullopt);
    EXPECT_EQ(row.adminStatus, kUp); // nobody can take it down
    EXPECT_EQ(row.operStatus, kUnknownStatus);
    EXPECT_EQ(row.lastChange, 0U);
    EXPECT_EQ(row.promiscuousMode, std::nullopt);
    EXPECT_EQ(row.counters[kInOctets], std::nullopt);
    EXPECT_EQ(row.physAddress, "");
}

TEST_F(InterfaceReaderTest, DescriptionIsMadePrintable) {
    addPort(m_chassis.insert("A"));
    EXPECT_EQ(readOne().description, "fake?port");
}

TEST_F(InterfaceReaderTest, InterfacesOfSeveralBoardsWithOneNameAreToldApart) {
    auto const first = m_chassis.insert("A");
    addPort(first);
    EXPECT_EQ(readOne().name, "eth1@A"); // with or without another board
    addPort(m_chassis.insert("B"));
    auto const rows = read();
    ASSERT_THAT(rows.interfaces, SizeIs(2));
    EXPECT_EQ(rows.interfaces[0].name, "eth1@A");
    EXPECT_EQ(rows.interfaces[1].name, "eth1@B");
    EXPECT_EQ(rows.interfaces[1].description, "fake?port of board B");
}

TEST_F(InterfaceReaderTest, InterfaceThatAppearsLaterHasChangedThen) {
    addPort(m_chassis.insert("A"));
    read();
    addPort(m_chassis.insert("B"));
    auto const rows = read();
    ASSERT_THAT(rows.interfaces, SizeIs(2));
    EXPECT_EQ(rows.interfaces[0].lastChange, 0U);
    EXPECT_EQ(rows.interfaces[1].lastChange, kHour);
}

TEST_F(InterfaceReaderTest, AddressesThatAnEthernetReceivesAreItsOwnAndBroadcasts) {
    addPort(m_chassis.insert("A")).address = std::string("\x02\0\x5e\0\0\x01", 6);
    auto const rows = read().receiveAddresses;
    ASSERT_THAT(rows, SizeIs(2));
    EXPECT_THAT(rows[0].index(), ElementsAre(1000, 6, 2, 0, 0x5e, 0, 0, 1));
    EXPECT_TRUE(rows[0].isOwn);
    EXPECT_THAT(rows[1].index(), ElementsAre(1000, 6, 255, 255, 255, 255, 255, 255));
    EXPECT_FALSE(rows[1].isOwn);
}

TEST_F(InterfaceReaderTest, EthernetWithoutAnAddressListsNone) {
    addPort(m_chassis.insert("A"));
    EXPECT_THAT(read().receiveAddresses, IsEmpty());
}

TEST_F(InterfaceReaderTest, AddressKeepsItsBytes) {
    addPort(m_chassis.insert("A")).address = std::string("\x02\0\xff", 3);
    EXPECT_EQ(readOne().physAddress, std::string("\x02\0\xff", 3));
}

TEST_F(InterfaceReaderTest, SpeedUsesAllBits) {
    addPort(m_chassis.insert("A")).speed = -1;
    EXPECT_EQ(readOne().speed, 4294967295U);
}

TEST_F(InterfaceReaderTest, StatisticsOfEthernetAreReadUnderTheSameIndex) {
    addPort(m_chassis.insert("A")).fcsErrors = -5;
    auto const rows = read();
    ASSERT_THAT(rows.ethernets, SizeIs(1));
    EXPECT_EQ(rows.ethernets[0].ifIndex, rows.interfaces[0].ifIndex);
    EXPECT_EQ(rows.ethernets[0].counters[kFcsErrors], 4294967291U);
    EXPECT_EQ(rows.ethernets[0].counters[kSymbolErrors], std::nullopt);
}

TEST_F(InterfaceReaderTest, CounterCountsOnWhenItWraps) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.inOctets = -10; // 2^32 - 10
    EXPECT_EQ(readOne().counters[kInOctets], 4294967286U);
    port.inOctets = 5;
    InterfaceRow const row = readOne();
    EXPECT_EQ(row.counters[kInOctets], 4294967301U);
    EXPECT_EQ(row.discontinuity, 0U);
}

TEST_F(InterfaceReaderTest, CounterThatBeginsAgainIsADiscontinuity) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.inOctets = -10; // 2^32 - 10
    read();
    port.inOctets = 5;
    EXPECT_EQ(readOne().counters[kInOctets], 4294967301U);
    port.inOctets = 4; // it cannot have wrapped within moments
    InterfaceRow const row = readOne();
    EXPECT_EQ(row.counters[kInOctets], 4U);
    EXPECT_EQ(row.discontinuity, kHour);
    port.inOctets = 6;
    EXPECT_EQ(readOne().counters[kInOctets], 6U);
    EXPECT_EQ(readOne().discontinuity, row.discontinuity);
}

TEST_F(InterfaceReaderTest, AllCountersOfAnInterfaceBeginAgainTogether) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.inOctets = 100;
    port.outErrors = -1;
    port.fcsErrors = 7;
    read();
    port.inOctets = 3;
    port.outErrors = 0; // would have wrapped
    auto const rows = read();
    EXPECT_EQ(rows.interfaces.at(0).counters[kInOctets], 3U);
    EXPECT_EQ(rows.interfaces.at(0).counters[kOutErrors], 0U);
    EXPECT_EQ(rows.ethernets.at(0).counters[kFcsErrors], 7U);
}

TEST_F(InterfaceReaderTest, EthernetStatisticThatBeginsAgainIsADiscontinuityToo) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.inOctets = 100;
    port.fcsErrors = 7;
    read();
    port.fcsErrors = 2;
    auto const rows = read();
    EXPECT_EQ(rows.ethernets.at(0).counters[kFcsErrors], 2U);
    EXPECT_EQ(rows.interfaces.at(0).discontinuity, kHour);
}

TEST_F(InterfaceReaderTest, EthernetStatisticCountsOnWhenItWraps) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.fcsErrors = -5;
    read();
    port.fcsErrors = 1;
    EXPECT_EQ(read().ethernets.at(0).counters[kFcsErrors], 4294967297U);
}

TEST_F(InterfaceReaderTest, CounterThatIsNotKnownForAWhileCountsOn) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.outErrors = -1;
    read();
    port.outErrors = KVL::kNotSupported;
    EXPECT_EQ(readOne().counters[kOutErrors], std::nullopt);
    port.outErrors = 0;
    EXPECT_EQ(readOne().counters[kOutErrors], 4294967296U);
}

TEST_F(InterfaceReaderTest, CounterOfABoardThatComesBackBeginsAnew) {
    auto const board = m_chassis.insert("A");
    addPort(board).inOctets = 7;
    EXPECT_EQ(readOne().discontinuity, 0U);
    m_chassis.factory->takeOut(board);
    EXPECT_THAT(read().interfaces, IsEmpty());
    addPort(m_chassis.insert("A")).inOctets = 3;
    InterfaceRow const row = readOne();
    EXPECT_EQ(row.counters[kInOctets], 3U);
    EXPECT_EQ(row.discontinuity, kHour);
}

TEST_F(InterfaceReaderTest, BoardThatIsExchangedBetweenReadingsBeginsAnew) {
    auto const board = m_chassis.insert("A");
    addPort(board).inOctets = 7;
    read();
    m_chassis.factory->takeOut(board);
    addPort(m_chassis.insert("A")).inOctets = 3;
    InterfaceRow const row = readOne();
    EXPECT_EQ(row.counters[kInOctets], 3U);
    EXPECT_EQ(row.discontinuity, kHour);
}

TEST_F(InterfaceReaderTest, BoardThatComesBackHasItsIndicesAgain) {
    auto const first = m_chassis.insert("A");
    auto const second = m_chassis.insert("B");
    addPort(first);
    addPort(second);
    EXPECT_THAT(readIndices(), ElementsAre(1000, 1016));
    m_chassis.factory->takeOut(first);
    EXPECT_THAT(readIndices(), ElementsAre(1016));
    addPort(m_chassis.insert("A"));
    EXPECT_THAT(readIndices(), ElementsAre(1000, 1016));
}

TEST_F(InterfaceReaderTest, BoardsWithoutSerialNumberOfTheirOwnHaveDifferentIndices) {
    for (char const* const serialNumber : {"unknown", "unknown", "", "A", "A"})
        addPort(m_chassis.insert(serialNumber));
    EXPECT_THAT(readIndices(), ElementsAre(1000, 1016, 1032, 1048, 1064));
}

TEST_F(InterfaceReaderTest, ChangeBeforeTheStartIsAtZero) {
    addPort(m_chassis.insert("A")).lastChange = 1;
    EXPECT_EQ(readOne().lastChange, 0U);
}

TEST_F(InterfaceReaderTest, ChangeAfterTheStartIsTimedFromThere) {
    addPort(m_chassis.insert("A")).lastChange = kDate;
    EXPECT_EQ(readOne().lastChange, kHour);
}

TEST_F(InterfaceReaderTest, ComingAndGoingIsTimedAndStayingIsNot) {
    addPort(m_chassis.insert("A"));
    EXPECT_EQ(read().lastChange, 0U);
    EXPECT_EQ(read().lastChange, 0U);
    addPort(m_chassis.insert("B"));
    auto const changed = read();
    EXPECT_EQ(changed.lastChange, kHour);
    EXPECT_EQ(changed.stackLastChange, kHour);
    EXPECT_EQ(read().lastChange, changed.lastChange);
}

TEST_F(InterfaceReaderTest, EthernetIsAPortOfItsBoard) {
    m_chassis.insert("A");
    addPort(m_chassis.insert("B"));
    auto const ports = read().ports;
    ASSERT_THAT(ports, SizeIs(1));
    EXPECT_EQ(ports[0].ifIndex, 1000U);
    EXPECT_EQ(ports[0].boardIndex, 2U);
    EXPECT_EQ(ports[0].key, (IndexKey{IndexKind::Ethernet, "1"}));
}

TEST_F(InterfaceReaderTest, InterfaceWithNothingAboveOrBelowStandsAlone) {
    addPort(m_chassis.insert("A"));
    EXPECT_THAT(read().stack, ElementsAre(StackRow{0, 1000}, StackRow{1000, 0}));
}

TEST_F(InterfaceReaderTest, TimeOfLastChangeStaysWhileTheOperStatusStays) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.operStatus = kUp;
    port.lastChange = 1;
    EXPECT_EQ(readOne().lastChange, 0U);
    // Something else has changed, as a line's alarms do.
    port.lastChange = kDate;
    EXPECT_EQ(readOne().lastChange, 0U);
    port.operStatus = kDown;
    EXPECT_EQ(readOne().lastChange, kHour);
    EXPECT_EQ(readOne().lastChange, kHour);
}

TEST_F(InterfaceReaderTest, ChangeThatBecomesCertainLaterIsTimedAtItsBeginning) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.operStatus = kUp;
    read();
    port.operStatus = kDown;
    port.lastChange = kDate - 10;
    EXPECT_EQ(readOne().lastChange, kHour - 1000);
    port.operStatus = kUp; // a date that is not of this change
    EXPECT_EQ(readOne().lastChange, kHour);
}

TEST_F(InterfaceReaderTest, ClockThatWasSetBackOrAheadMovesNoTimeOfChange) {
    FakeEthernet& port = addPort(m_chassis.insert("A"));
    port.operStatus = kUp;
    port.lastChange = kDate + 100000;       // before the clock was set back
    EXPECT_EQ(readOne().lastChange, kHour); // not in the future
    port.operStatus = kDown;
    port.lastChange = 1; // set back further
    EXPECT_EQ(readOne().lastChange, kHour);
}

TEST_F(InterfaceReaderTest, BoardThatThrowsKeepsNoOtherFromBeingRead) {
    auto const faulty = m_chassis.insert("A");
    addPort(faulty).address = "x";
    addPort(m_chassis.insert("B"));
    ASSERT_THAT(readIndices(), ElementsAre(1000, 1016));
    faulty->AddFeature(ReferenceCounter<Feature>(new ThrowingFeature));
    LogCapture logged;
    EXPECT_THAT(readIndices(), ElementsAre(1016));
    EXPECT_THAT(readIndices(), ElementsAre(1016));
    std::string const message = logged.take();
    EXPECT_EQ(linesIn(message), 1) << message;
    EXPECT_THAT(message, ::testing::HasSubstr("board 1: its interfaces cannot be read: no answer"));
}

} // namespace
} // namespace kvloamd
