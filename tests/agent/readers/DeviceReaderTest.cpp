// SPDX-License-Identifier: BSD-2-Clause
// What is read of a board's devices, sub-devices and processors, from the simulated device mapper.
#include "agent/rows/DeviceRows.h"

#include <gtest/gtest.h>

#include "agent/readers/BoardFinder.h"
#include "agent/readers/DeviceReader.h"
#include "tests/support/SimulatedPlatform.h"

namespace kvloamd {
namespace {

using namespace std::string_literals;

/// Reads board 5 as index 2.
class DeviceRowsTest : public ::testing::Test {
  protected:
    static DeviceRows read(std::string const& objects) {
        sim::load({sim::board(5, "S5", "", objects)});
        return readDevices(5, 2);
    }
    static std::string protocolTypes(std::string const& attributes) {
        return read("devices: [{handle: 51, type: 501, attributes: {" + attributes + "}}]")
            .devices.at(0)
            .protocolTypes;
    }
};

TEST_F(DeviceRowsTest, EveryAttributeOfADeviceHasItsField) {
    auto const rows = read("devices: [{handle: 51, type: 505, attributes: {NAME: span, "
                           "ChannelCount: 30, LINEADMINADDR: {descriptor: [1, 258, 0, 65535]}, "
                           "Protocol_Type_0: 1, Protocol_Type_1: 3}}]");
    ASSERT_EQ(rows.devices.size(), 1U);
    DeviceRow const& row = rows.devices[0];
    EXPECT_EQ(row.index(), (std::array<std::uint32_t, 2>{2, 51}));
    EXPECT_EQ(row.name, "span");
    EXPECT_EQ(row.type, 505);
    EXPECT_EQ(row.channelCount, 30);
    EXPECT_EQ(row.lineAdminAddress, "\x00\x01\x01\x02\x00\x00\xff\xff"s);
    EXPECT_EQ(row.protocolTypes, "1,3");
}

TEST_F(DeviceRowsTest, EveryAttributeOfASubDeviceHasItsField) {
    auto const rows = read("devices: [{handle: 51, type: 501, subdevices: [{handle: 61, type: 502, "
                           "attributes: {NAME: slots, Out_Variant: -1, FrontEndType: 2, "
                           "TSCADDR: {descriptor: [1, 0, 0, 0]}, "
                           "CLUSTERADDR: {descriptor: [2, 0, 0, 0]}, "
                           "CTBUSADDR: {descriptor: [3, 0, 0, 0]}, "
                           "IPVSCADDR: {descriptor: [4, 0, 0, 0]}}}]}]");
    ASSERT_EQ(rows.subDevices.size(), 1U);
    SubDeviceRow const& row = rows.subDevices[0];
    EXPECT_EQ(row.index(), (std::array<std::uint32_t, 3>{2, 51, 61}));
    EXPECT_EQ(row.name, "slots");
    EXPECT_EQ(row.type, 502);
    EXPECT_EQ(row.outVariant, -1);
    EXPECT_EQ(row.tscAddress, "\x00\x01\x00\x00\x00\x00\x00\x00"s);
    EXPECT_EQ(row.clusterAddress, "\x00\x02\x00\x00\x00\x00\x00\x00"s);
    EXPECT_EQ(row.ctBusAddress, "\x00\x03\x00\x00\x00\x00\x00\x00"s);
    EXPECT_EQ(row.ipvscAddress, "\x00\x04\x00\x00\x00\x00\x00\x00"s);
    EXPECT_EQ(row.frontEndType, 2);
}

TEST_F(DeviceRowsTest, EveryAttributeOfAProcessorHasItsField) {
    auto const rows = read("processors: [{handle: 91, attributes: {NAME: control, PROC_NUM: 1, "
                           "BK_VERSION: \"1.08\", BK_FILE: boot.bin, RTK_VERSION: \"3.51\", "
                           "RTK_FILE: kernel.bin}}]");
    ASSERT_EQ(rows.processors.size(), 1U);
    ProcessorRow const& row = rows.processors[0];
    EXPECT_EQ(row.index(), (std::array<std::uint32_t, 2>{2, 91}));
    EXPECT_EQ(row.name, "control");
    EXPECT_EQ(row.number, 1);
    EXPECT_EQ(row.bootKernelVersion, "1.08");
    EXPECT_EQ(row.bootKernelFile, "boot.bin");
    EXPECT_EQ(row.realTimeKernelVersion, "3.51");
    EXPECT_EQ(row.realTimeKernelFile, "kernel.bin");
}

TEST_F(DeviceRowsTest, AttributesThatADeviceLacksAreLeftEmpty) {
    auto const rows = read("devices: [{handle: 51, type: 501}]");
    ASSERT_EQ(rows.devices.size(), 1U);
    EXPECT_EQ(rows.devices[0].name, "");
    EXPECT_EQ(rows.devices[0].channelCount, std::nullopt);
    EXPECT_EQ(rows.devices[0].lineAdminAddress, "");
    EXPECT_EQ(rows.devices[0].protocolTypes, "");
}

TEST_F(DeviceRowsTest, AttributesThatASubDeviceLacksAreLeftEmpty) {
    auto const rows =
        read("devices: [{handle: 51, type: 501, subdevices: [{handle: 61, type: 502}]}]");
    ASSERT_EQ(rows.subDevices.size(), 1U);
    EXPECT_EQ(rows.subDevices[0].name, "");
    EXPECT_EQ(rows.subDevices[0].outVariant, std::nullopt);
    EXPECT_EQ(rows.subDevices[0].tscAddress, "");
    EXPECT_EQ(rows.subDevices[0].clusterAddress, "");
    EXPECT_EQ(rows.subDevices[0].ctBusAddress, "");
    EXPECT_EQ(rows.subDevices[0].ipvscAddress, "");
    EXPECT_EQ(rows.subDevices[0].frontEndType, std::nullopt);
}

TEST_F(DeviceRowsTest, AttributesThatAProcessorLacksAreLeftEmpty) {
    auto const rows = read("processors: [{handle: 91}]");
    ASSERT_EQ(rows.processors.size(), 1U);
    EXPECT_EQ(rows.processors[0].name, "");
    EXPECT_EQ(rows.processors[0].number, std::nullopt);
    EXPECT_EQ(rows.processors[0].bootKernelVersion, "");
    EXPECT_EQ(rows.processors[0].bootKernelFile, "");
    EXPECT_EQ(rows.processors[0].realTimeKernelVersion, "");
    EXPECT_EQ(rows.processors[0].realTimeKernelFile, "");
}

TEST_F(DeviceRowsTest, GroupWithoutProtocolBeforeAnotherReadsAsZero) {
    EXPECT_EQ(protocolTypes("Protocol_Type_1: 5"), "0,5");
}

TEST_F(DeviceRowsTest, ProtocolTypesEndWithTheEighthGroup) {
    EXPECT_EQ(protocolTypes("Protocol_Type_7: 2, Protocol_Type_8: 3"), "0,0,0,0,0,0,0,2");
}

TEST_F(DeviceRowsTest, RowsAreInTheOrderOfTheirHandlesWhateverTheirTypes) {
    auto const rows = read("devices: [{handle: 53, type: 501, subdevices: [{handle: 60, type: "
                           "502}]}, {handle: 51, type: 527}, {handle: 52, type: 503, subdevices: "
                           "[{handle: 62, type: 504}, {handle: 61, type: 528}]}]");
    ASSERT_EQ(rows.devices.size(), 3U);
    EXPECT_EQ(rows.devices[0].auid, 51U);
    EXPECT_EQ(rows.devices[1].auid, 52U);
    EXPECT_EQ(rows.devices[2].auid, 53U);
    ASSERT_EQ(rows.subDevices.size(), 3U);
    EXPECT_EQ(rows.subDevices[0].auid, 61U);
    EXPECT_EQ(rows.subDevices[1].auid, 62U);
    EXPECT_EQ(rows.subDevices[2].auid, 60U);
}

TEST_F(DeviceRowsTest, TextsArePrintable) {
    auto const rows = read("processors: [{handle: 91, attributes: {NAME: \"a\\xe9z\"}}]");
    EXPECT_EQ(rows.processors.at(0).name.front(), 'a');
    EXPECT_EQ(rows.processors.at(0).name.back(), 'z');
    EXPECT_NE(rows.processors.at(0).name.find('?'), std::string::npos);
}

TEST(BoardFinderTest, BoardIsFoundByItsSerialNumber) {
    sim::load({sim::board(5, "S5"), sim::board(7, "S7")});
    BoardFinder const finder;
    EXPECT_TRUE(finder.good());
    EXPECT_EQ(finder.find("S7"), 7);
    EXPECT_EQ(finder.find("S8"), std::nullopt);
}

TEST(BoardFinderTest, BoardsBeyondTheFirstCapacityAreFound) {
    sim::loadMany(600);
    BoardFinder const finder;
    EXPECT_EQ(finder.find("S1"), 1);
    EXPECT_EQ(finder.find("S600"), 600);
}

TEST(BoardFinderTest, UnknownIsNoSerialNumber) {
    sim::load({sim::board(5, "unknown")});
    EXPECT_EQ(BoardFinder().find("unknown"), std::nullopt);
}

} // namespace
} // namespace kvloamd
