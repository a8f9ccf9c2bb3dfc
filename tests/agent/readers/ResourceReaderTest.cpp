// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/ResourceRow.h"

#include <initializer_list>

#include <gtest/gtest.h>

#include "agent/readers/ResourceReader.h"
#include "board/ISDNChannel.h"
#include "tests/support/FakeBoards.h"
#include "z7/Z7ResourceFeature.h"

namespace kvloamd {
namespace {

/// A device of a kind, with the answers that all devices give.
template <class Kind>
class FakeDevice : public Kind {
  public:
    explicit FakeDevice(char const* name, int type = -1) : Kind(name) { this->m_type = type; }

    int common = -1;

    int GetStatus() override { return common; }
    int GetBoardIndex() override { return common; }
    int GetDeviceNumber() override { return common; }
};

class FakeVoice final : public FakeDevice<Z7VoiceDevice> {
  public:
    FakeVoice(int gain, int echo) : FakeDevice("voice", 503), m_gain(gain), m_echo(echo) {}

    int GetCoderType() override { return 4; }
    int GetChannelState() override { return 0; }
    int GetGain() override { return m_gain; }
    int GetEchoCancellation() override { return m_echo; }

  private:
    int m_gain;
    int m_echo;
};

template <class Kind>
class FakeTrunkOf : public FakeDevice<Kind> {
  public:
    using FakeDevice<Kind>::FakeDevice;

    int GetLineNumber() override { return 1; }
    int GetLineType() override { return 2; }
    int GetLineStatus() override { return 64; }
    int GetProtocolType() override { return -1; }
};

using FakeTrunk = FakeTrunkOf<Z7TRKDevice>;

class FakeIsdnTrunk final : public FakeTrunkOf<Z7ISDNDevice> {
  public:
    explicit FakeIsdnTrunk(int status) : FakeTrunkOf("isdn", 514), m_status(status) {}

    int GetBChannelCount() override { return 30; }
    int GetDChannelStatus() override { return m_status; }

  private:
    int m_status;
};

class FakeStation final : public FakeDevice<Z7STNDevice> {
  public:
    using FakeDevice::FakeDevice;

    int GetTimeSlotCount() override { return 16; }
};

class FakeResources final : public Z7ResourceFeature {
  public:
    FakeResources(std::initializer_list<Z7Device*> devices) {
        for (Z7Device* const device : devices)
            m_devices.emplace_back(device);
    }
    int GetNumberOfDevices() override { return static_cast<int>(m_devices.size()); }
};

class ResourceRowsTest : public ::testing::Test {
  protected:
    /// Enters a board with these resources; its index is 1, 2 ...
    void insert(std::initializer_list<Z7Device*> devices) {
        auto const board = m_chassis.insert("S" + std::to_string(m_boards.size() + 1));
        board->AddFeature(ReferenceCounter<Feature>(new FakeResources(devices)));
        BoardRow row;
        row.boardIndex = static_cast<std::uint32_t>(m_boards.size() + 1);
        m_boards.push_back(row);
    }
    Rows<ResourceRow> read() { return m_reader.read(m_boards); }
    /// The row of the one device of one board.
    ResourceRow rowOf(Z7Device* device) {
        insert({device});
        return read().at(0);
    }

    FakeChassis m_chassis;
    Rows<BoardRow> m_boards;
    ResourceReader m_reader{*m_chassis.manager.get()};
};

TEST_F(ResourceRowsTest, DevicesHavePlacesOnTheirBoards) {
    insert({new FakeVoice(0, 1), new FakeStation("b")});
    insert({new FakeStation("c")});
    auto const rows = read();
    ASSERT_EQ(rows.size(), 3U);
    EXPECT_EQ(rows[0].index(), (std::array<std::uint32_t, 2>{1, 1}));
    EXPECT_EQ(rows[1].index(), (std::array<std::uint32_t, 2>{1, 2}));
    EXPECT_EQ(rows[1].name, "b");
    EXPECT_EQ(rows[2].index(), (std::array<std::uint32_t, 2>{2, 1}));
}

TEST_F(ResourceRowsTest, PlacesGoOnInTheNextFeatureOfTheBoard) {
    insert({new FakeStation("a")});
    m_chassis.manager->GetBoardByIndex(1)->AddFeature(
        ReferenceCounter<Feature>(new FakeResources({new FakeStation("b")})));
    auto const rows = read();
    ASSERT_EQ(rows.size(), 2U);
    EXPECT_EQ(rows[1].place, 2U);
}

TEST_F(ResourceRowsTest, VoiceDeviceHasItsFieldsAndNoOthers) {
    ResourceRow const row = rowOf(new FakeVoice(-6, 2));
    EXPECT_EQ(row.kind, ResourceKind::Voice);
    EXPECT_EQ(row.type, 503);
    EXPECT_EQ(row.coderType, 4);
    EXPECT_EQ(row.channelState, 0);
    EXPECT_EQ(row.gain, -6);
    EXPECT_EQ(row.echoCancellation, 2);
    EXPECT_EQ(row.lineNumber, std::nullopt);
    EXPECT_EQ(row.timeSlotCount, std::nullopt);
}

TEST_F(ResourceRowsTest, TrunkHasTheFieldsOfItsLine) {
    ResourceRow const row = rowOf(new FakeTrunk("trunk", 501));
    EXPECT_EQ(row.kind, ResourceKind::Trunk);
    EXPECT_EQ(row.lineNumber, 1);
    EXPECT_EQ(row.lineType, 2);
    EXPECT_EQ(row.lineStatus, 64);
    EXPECT_EQ(row.protocolType, std::nullopt);
    EXPECT_EQ(row.bearerCount, std::nullopt);
}

TEST_F(ResourceRowsTest, IsdnTrunkHasTheFieldsOfATrunkToo) {
    ResourceRow const row = rowOf(new FakeIsdnTrunk(ISDNDChannelStatusL2Active));
    EXPECT_EQ(row.kind, ResourceKind::IsdnTrunk);
    EXPECT_EQ(row.lineStatus, 64);
    EXPECT_EQ(row.bearerCount, 30);
    EXPECT_EQ(row.signallingStatus, 3);
}

TEST_F(ResourceRowsTest, StationHasItsTimeSlots) {
    ResourceRow const row = rowOf(new FakeStation("station", 525));
    EXPECT_EQ(row.kind, ResourceKind::Station);
    EXPECT_EQ(row.timeSlotCount, 16);
}

TEST_F(ResourceRowsTest, DeviceOfNoKindIsListedAllTheSame) {
    auto* const device = new FakeDevice<Z7Device>("plain");
    device->common = 1;
    ResourceRow const row = rowOf(device);
    EXPECT_EQ(row.kind, ResourceKind::Other);
    EXPECT_EQ(row.name, "plain");
    EXPECT_EQ(row.status, 1);
    EXPECT_EQ(row.moduleBoard, 1);
    EXPECT_EQ(row.number, 1);
}

TEST_F(ResourceRowsTest, WhatADeviceCanNotAnswerIsLeftOut) {
    ResourceRow const row = rowOf(new FakeDevice<Z7Device>("plain"));
    EXPECT_EQ(row.type, std::nullopt);
    EXPECT_EQ(row.status, std::nullopt);
    EXPECT_EQ(row.moduleBoard, std::nullopt);
    EXPECT_EQ(row.number, std::nullopt);
}

TEST_F(ResourceRowsTest, UnknownGainIsLeftOut) {
    EXPECT_EQ(rowOf(new FakeVoice(-1, 1)).gain, std::nullopt);
}

TEST_F(ResourceRowsTest, StatesWithoutANameAreLeftOut) {
    EXPECT_EQ(rowOf(new FakeVoice(0, 3)).echoCancellation, std::nullopt);
    insert({new FakeIsdnTrunk(0)});
    EXPECT_EQ(read().at(1).signallingStatus, std::nullopt);
}

TEST_F(ResourceRowsTest, NameThatFillsItsRoomIsReadToItsEndOnly) {
    std::string const name(100, 'x');
    EXPECT_EQ(rowOf(new FakeStation(name.c_str())).name, std::string(Z7Device::kNameSize, 'x'));
}

TEST_F(ResourceRowsTest, BoardThatHasGoneHasNoRows) {
    insert({new FakeStation("a")});
    m_chassis.factory->takeOut(m_chassis.manager->GetBoardByIndex(1));
    EXPECT_TRUE(read().empty());
}

} // namespace
} // namespace kvloamd
