// SPDX-License-Identifier: BSD-2-Clause
// A board's record, read from the simulated device mapper.
#include <cstdlib>
#include <ctime>

#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "access/DevMapBoardIf.h"
#include "tests/support/SimulatedPlatform.h"

namespace {

constexpr char const* kWhole =
    "NAME: NX5-T1, DESCRIPTION: Trunk board, FAMILY: NX5, FIRMWARE_NAME: nx5.fw, "
    "FIRMWARE_NAME1: nx5_dsp.fw, FIRMWARE_VERSION: \"4.2\", PCI_SLOT_NUMBER: 4, "
    "PCI_BUS_NUMBER: 2, SHELF_ID: 1, CHASSIS_SLOT: 3, MEMBASEADDR: 0xD000, IOBASEADDR: 0xE800, "
    "IRQ: 11, VORN_DRIVER_BOARD_ID: 100, Board Id (BLT ID): 16, LOGICAL ID: 7";

class DevMapBoardIfTest : public testing::Test {
  protected:
    /// A record of board 5 with these attributes and its serial number.
    static DevMapBoardIf record(std::string const& attributes, std::string const& rest = "") {
        sim::load({sim::board(5, "S5", attributes, rest)});
        return DevMapBoardIf(5);
    }
    /// The state change date of board 5 for the attribute `text`, in the time zone `zone`.
    static time_t dateOf(char const* text, char const* zone) {
        setenv("TZ", zone, 1);
        tzset();
        DevMapBoardIf board = record("STATE_CHANGE_DATE: \"" + std::string(text) + "\"");
        return board.StateChangeDate();
    }
    static std::string devices(std::initializer_list<std::pair<int, int>> handlesAndTypes) {
        std::string text = "devices: [";
        for (auto const& [handle, type] : handlesAndTypes)
            text += "{handle: " + std::to_string(handle) + ", type: " + std::to_string(type) + "},";
        return text + "]";
    }
};

TEST_F(DevMapBoardIfTest, RecordHoldsEveryAttribute) {
    DevMapBoardIf const board = record(kWhole);
    EXPECT_EQ(board.SerialNumber(), "S5");
    EXPECT_EQ(board.Name(), "NX5-T1");
    EXPECT_EQ(board.Description(), "Trunk board");
    EXPECT_EQ(board.Family(), "NX5");
    EXPECT_EQ(board.FirmwareName(), "nx5.fw");
    EXPECT_EQ(board.FirmwareName1(), "nx5_dsp.fw");
    EXPECT_EQ(board.FirmwareVersion(), "4.2");
    EXPECT_EQ(board.PciSlotNumber(), 4);
    EXPECT_EQ(board.PciBusNumber(), 2);
    EXPECT_EQ(board.ShelfID(), 1);
    EXPECT_EQ(board.ChassisSlot(), 3);
    EXPECT_EQ(board.SharedMemoryBaseAddress(), 0xD000);
    EXPECT_EQ(board.IOBaseAddress(), 0xE800);
    EXPECT_EQ(board.IRQ(), 11);
    EXPECT_EQ(board.VORNDriverBoardID(), 100);
    EXPECT_EQ(board.BoardID(), 16);
}

TEST_F(DevMapBoardIfTest, MissingTextsAreUnknown) {
    DevMapBoardIf const board = record("");
    EXPECT_EQ(board.Family(), "unknown");
    EXPECT_EQ(board.Name(), "unknown");
    EXPECT_EQ(board.Description(), "unknown");
    EXPECT_EQ(board.FirmwareName(), "unknown");
    EXPECT_EQ(board.FirmwareName1(), "unknown");
    EXPECT_EQ(board.FirmwareVersion(), "unknown");
}

TEST_F(DevMapBoardIfTest, MissingNumbersAreMinusOne) {
    DevMapBoardIf const board = record("");
    EXPECT_EQ(board.IRQ(), -1);
    EXPECT_EQ(board.PciSlotNumber(), -1);
    EXPECT_EQ(board.PciBusNumber(), -1);
    EXPECT_EQ(board.SharedMemoryBaseAddress(), -1);
    EXPECT_EQ(board.IOBaseAddress(), -1);
    EXPECT_EQ(board.BoardID(), -1);
}

TEST_F(DevMapBoardIfTest, MissingNumbersReadInPlaceAreMinusOneInARequestThatFailsInPart) {
    DevMapBoardIf const board = record("");
    EXPECT_EQ(board.ShelfID(), -1);
    EXPECT_EQ(board.ChassisSlot(), -1);
    EXPECT_EQ(board.VORNDriverBoardID(), -1);
}

TEST_F(DevMapBoardIfTest, HandleOfNoBoardMakesARecordOfNothing) {
    sim::load({});
    DevMapBoardIf board(77);
    EXPECT_EQ(board.SerialNumber(), "unknown");
    EXPECT_EQ(board.IRQ(), -1);
    EXPECT_EQ(board.ShelfID(), -1);
    EXPECT_EQ(board.LogicalID(), -1);
    EXPECT_EQ(board.BoardPresent(), -1);
    EXPECT_EQ(board.StateChangeDate(), 0);
    EXPECT_TRUE(board.ListAllDevices().empty());
}

TEST_F(DevMapBoardIfTest, EmptyTextIsNotUnknown) {
    EXPECT_EQ(record("FAMILY: \"\"").Family(), "");
}

TEST_F(DevMapBoardIfTest, MemoryAddressAnsweredWithoutBytesIsZero) {
    EXPECT_EQ(record("MEMBASEADDR: {empty: true}").SharedMemoryBaseAddress(), 0);
}

TEST_F(DevMapBoardIfTest, MemoryAddressAnsweredInOneByteIsZero) {
    EXPECT_EQ(record("MEMBASEADDR: {byte: 5}").SharedMemoryBaseAddress(), 0);
}

TEST_F(DevMapBoardIfTest, MemoryAddressAnsweredInTwoBytesIsSigned) {
    EXPECT_EQ(record("MEMBASEADDR: {short: 0xFFFF}").SharedMemoryBaseAddress(), -1);
    EXPECT_EQ(record("MEMBASEADDR: {short: 0x1234}").SharedMemoryBaseAddress(), 0x1234);
}

TEST_F(DevMapBoardIfTest, MemoryAddressOfFourBytesIsSigned) {
    EXPECT_EQ(record("MEMBASEADDR: 0xD0000000").SharedMemoryBaseAddress(),
              static_cast<std::int32_t>(0xD0000000));
}

TEST_F(DevMapBoardIfTest, NumbersAnsweredInTwoBytesAreSigned) {
    DevMapBoardIf const board =
        record("IRQ: {short: -2}, IOBASEADDR: {short: 0x8000}, PCI_SLOT_NUMBER: {short: 6}, "
               "PCI_BUS_NUMBER: {short: -1}, Board Id (BLT ID): {short: -300}");
    EXPECT_EQ(board.IRQ(), -2);
    EXPECT_EQ(board.IOBaseAddress(), -32768);
    EXPECT_EQ(board.PciSlotNumber(), 6);
    EXPECT_EQ(board.PciBusNumber(), -1);
    EXPECT_EQ(board.BoardID(), -300);
}

TEST_F(DevMapBoardIfTest, NegativeNumbersReadInPlaceStayNegative) {
    EXPECT_EQ(record("SHELF_ID: -5").ShelfID(), -5);
}

TEST_F(DevMapBoardIfTest, SnapshotStaysAsItWas) {
    DevMapBoardIf const board = record("NAME: before, IRQ: 5");
    sim::set(5, "NAME", "after");
    sim::set(5, "IRQ", 6);
    EXPECT_EQ(board.Name(), "before");
    EXPECT_EQ(board.IRQ(), 5);
}

TEST_F(DevMapBoardIfTest, LiveAttributesFollowThePlatform) {
    DevMapBoardIf board = record("LOGICAL ID: 7, BOARD_CONDITION: 3, BOARD_PRESENT: 1");
    EXPECT_EQ(board.LogicalID(), 7);
    EXPECT_EQ(board.BoardCondition(), 3);
    EXPECT_EQ(board.BoardPresent(), 1);
    sim::set(5, "LOGICAL ID", 8);
    sim::set(5, "BOARD_CONDITION", 15);
    sim::set(5, "BOARD_PRESENT", 0);
    EXPECT_EQ(board.LogicalID(), 8);
    EXPECT_EQ(board.BoardCondition(), 15);
    EXPECT_EQ(board.BoardPresent(), 0);
}

TEST_F(DevMapBoardIfTest, LiveAttributesThatAreMissingAreMinusOne) {
    DevMapBoardIf board = record("");
    sim::unset(5, "BOARD_CONDITION");
    sim::unset(5, "BOARD_PRESENT");
    EXPECT_EQ(board.LogicalID(), -1);
    EXPECT_EQ(board.BoardCondition(), -1);
    EXPECT_EQ(board.BoardPresent(), -1);
}

TEST_F(DevMapBoardIfTest, LogicalIDAnsweredInTwoBytesIsSigned) {
    EXPECT_EQ(record("LOGICAL ID: {short: -3}").LogicalID(), -3);
}

TEST_F(DevMapBoardIfTest, StateChangeDateIsReadAsLocalTime) {
    EXPECT_EQ(dateOf("Tue Mar  2 09:05:00 2004", "UTC0"), 1078218300);
    EXPECT_EQ(dateOf("Tue Mar  2 09:05:00 2004", "EST5"), 1078218300 + 5 * 3600);
}

TEST_F(DevMapBoardIfTest, StateChangeDateInSummerTimeIsReadAsSummerTime) {
    EXPECT_EQ(dateOf("Mon Jul  5 14:00:00 2004", "CET-1CEST,M3.5.0,M10.5.0/3"),
              dateOf("Mon Jul  5 12:00:00 2004", "UTC0"));
}

TEST_F(DevMapBoardIfTest, StateChangeDateThatIsNoDateIsZero) {
    EXPECT_EQ(dateOf("yesterday", "UTC0"), 0);
}

TEST_F(DevMapBoardIfTest, StateChangeDateThatIsTooLateForTheSystemsTimeIsZero) {
    time_t const known = sizeof(time_t) == 4 ? 0 : static_cast<time_t>(4102444800);
    EXPECT_EQ(dateOf("Fri Jan  1 00:00:00 2100", "UTC0"), known);
}

TEST_F(DevMapBoardIfTest, StateChangeDateThatIsMissingIsZero) {
    DevMapBoardIf board = record("");
    sim::unset(5, "STATE_CHANGE_DATE");
    EXPECT_EQ(board.StateChangeDate(), 0);
}

TEST_F(DevMapBoardIfTest, AllDevicesAreListedTypeByTypeInTableOrder) {
    DevMapBoardIf board = record("", devices({{113, 527},
                                              {112, 525},
                                              {111, 511},
                                              {110, 521},
                                              {109, 520},
                                              {108, 518},
                                              {107, 516},
                                              {106, 514},
                                              {105, 509},
                                              {104, 507},
                                              {103, 505},
                                              {102, 503},
                                              {101, 501},
                                              {201, 501}}));
    EXPECT_EQ(board.ListAllDevices(), (std::vector<long>{101, 201, 102, 103, 104, 105, 106, 107,
                                                         108, 109, 110, 111, 112, 113}));
}

TEST_F(DevMapBoardIfTest, DevicesOfOneTypeAreListedAlone) {
    DevMapBoardIf board = record("", devices({{101, 503}, {102, 501}, {103, 503}}));
    EXPECT_EQ(board.ListDevicesByType(503), (std::vector<long>{101, 103}));
    EXPECT_TRUE(board.ListDevicesByType(505).empty());
}

TEST_F(DevMapBoardIfTest, ProcessorsAreListedApartFromDevices) {
    DevMapBoardIf board =
        record("", devices({{101, 501}}) + ", processors: [{handle: 191}, {handle: 192}]");
    EXPECT_EQ(board.ListProcessors(), (std::vector<long>{191, 192}));
    EXPECT_EQ(board.ListAllDevices(), (std::vector<long>{101}));
}

TEST_F(DevMapBoardIfTest, DevicesBeyondTheCapacityOfOneSearchAreLeftOut) {
    std::string text = "devices: [";
    for (int i = 0; i < 150; ++i)
        text += "{handle: " + std::to_string(1000 + i) + ", type: 503},";
    text += "{handle: 9001, type: 501}, {handle: 9002, type: 505}]";
    DevMapBoardIf board = record("", text);
    EXPECT_EQ(board.ListDevicesByType(503).size(), 100U);
    std::vector<long> const all = board.ListAllDevices();
    ASSERT_EQ(all.size(), 102U);
    EXPECT_EQ(all.front(), 9001);
    EXPECT_EQ(all.at(100), 1099);
    EXPECT_EQ(all.back(), 9002);
}

} // namespace
