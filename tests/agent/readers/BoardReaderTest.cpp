// SPDX-License-Identifier: BSD-2-Clause
#include "agent/rows/BoardRow.h"

#include <cstdlib>
#include <ctime>

#include <gtest/gtest.h>

#include "agent/readers/Answers.h"
#include "agent/readers/BoardReader.h"
#include "board/Board.h"
#include "tests/support/FakeBoards.h"

namespace kvloamd {
namespace {

/// Reads dates in a time zone of the test's choice.
class DateOctetsTest : public ::testing::Test {
  protected:
    static std::string inZone(char const* zone, long seconds) {
        setenv("TZ", zone, 1);
        tzset();
        return dateOctets(seconds);
    }
    static std::string octets(std::initializer_list<int> values) {
        std::string text;
        for (int const value : values)
            text.push_back(static_cast<char>(value));
        return text;
    }
    ~DateOctetsTest() override {
        unsetenv("TZ");
        tzset();
    }
};

TEST(BoardRowTest, EveryQueryHasItsField) {
    FakeChassis chassis;
    BoardRow const row = readBoard(*chassis.insert("S-9").get(), 3);
    EXPECT_EQ(row.boardIndex, 3U);
    EXPECT_EQ(row.status, BoardStatusStarted);
    EXPECT_EQ(row.secondaryStatus, BoardStatusNone);
    EXPECT_EQ(row.name, "text name");
    EXPECT_EQ(row.model, "text model");
    EXPECT_EQ(row.family, "text family");
    EXPECT_EQ(row.firmwareName, "text firmware");
    EXPECT_EQ(row.firmwareVersion, "text version");
    EXPECT_EQ(row.serialNumber, "S-9");
    EXPECT_EQ(row.logicalId, 7);
    EXPECT_EQ(row.errorMessage, "text error");
    EXPECT_EQ(row.functionalDescription, "text description");
    EXPECT_EQ(row.boardId, 8);
    EXPECT_EQ(row.sharedMemoryAddress, "0x00001000");
    EXPECT_EQ(row.ioAddress, "0x00001001");
    EXPECT_EQ(row.irq, 9);
    EXPECT_EQ(row.shelfId, 10);
    EXPECT_EQ(row.pciSlotNumber, 11);
    EXPECT_EQ(row.busNumber, 12);
}

TEST(BoardRowTest, UnknownNumbersAreLeftEmpty) {
    FakeChassis chassis;
    ReferenceCounter<Board> const board = chassis.insert("S");
    FakeChassis::fake(board).number = -1;
    FakeChassis::fake(board).address = -1;
    BoardRow const row = readBoard(*board.get(), 1);
    EXPECT_EQ(row.logicalId, std::nullopt);
    EXPECT_EQ(row.boardId, std::nullopt);
    EXPECT_EQ(row.irq, std::nullopt);
    EXPECT_EQ(row.shelfId, std::nullopt);
    EXPECT_EQ(row.pciSlotNumber, std::nullopt);
    EXPECT_EQ(row.busNumber, std::nullopt);
    EXPECT_EQ(row.sharedMemoryAddress, "");
    EXPECT_EQ(row.ioAddress, "");
    EXPECT_EQ(row.changeDate, "");
}

TEST(BoardRowTest, TextLongerThanThePlatformsIsCutAtWhatIsServed) {
    FakeChassis chassis;
    ReferenceCounter<Board> const board = chassis.insert("S");
    FakeChassis::fake(board).text = std::string(3000, 'x');
    EXPECT_EQ(readBoard(*board.get(), 1).name, std::string(255, 'x'));
}

TEST(PrintableTest, WhatIsNotPrintableBecomesAQuestionMark) {
    EXPECT_EQ(printable("a\tb\x7f"
                        "c\xc3\xa9 ~"),
              "a?b?c?? ~");
}

TEST(AddressTextTest, AddressHasEightDigitsAtLeast) {
    EXPECT_EQ(addressText(0xE800), "0x0000e800");
}

TEST(AddressTextTest, SignExtendedAddressOfFourBytesReadsAsFourBytes) {
    EXPECT_EQ(addressText(static_cast<std::int32_t>(0xD0000000U)), "0xd0000000");
}

TEST(AddressTextTest, ZeroIsAnAddress) {
    EXPECT_EQ(addressText(0), "0x00000000");
}

TEST(AddressTextTest, MinusOneIsUnknown) {
    EXPECT_EQ(addressText(-1), "");
}

TEST_F(DateOctetsTest, DateIsLocalWithItsOffset) {
    EXPECT_EQ(inZone("XXX-5:30", 951782400), // 29 February 2000, midnight UTC
              octets({7, 208, 2, 29, 5, 30, 0, 0, '+', 5, 30}));
}

TEST_F(DateOctetsTest, OffsetWestOfGreenwichIsNegative) {
    EXPECT_EQ(inZone("XXX3:30", 951782400), octets({7, 208, 2, 28, 20, 30, 0, 0, '-', 3, 30}));
}

TEST_F(DateOctetsTest, ZeroIsUnknown) {
    EXPECT_EQ(inZone("UTC0", 0), "");
}

TEST_F(DateOctetsTest, YearBeyondFourDigitsIsUnknown) {
    EXPECT_EQ(inZone("UTC0", 253402300800), "");
}

} // namespace
} // namespace kvloamd
