// SPDX-License-Identifier: BSD-2-Clause
// A board's record in the attribute store, with the simulated store.
#include "access/QSBBoard.h"

#include <climits>

#include "tests/support/SimulatedPlatform.h"
#include "tests/support/SimulatedStore.h"

namespace {

class QSBBoardTest : public testing::Test {
  protected:
    QSBBoardTest() {
        sim::load({sim::board(1, "A1",
                              "FAMILY: NX5, NAME: NX5-T1, DESCRIPTION: Trunk board, "
                              "FIRMWARE_NAME: nx5.fw, FIRMWARE_VERSION: \"4.2\", MEMBASEADDR: "
                              "0xD0000000, IOBASEADDR: 0xE800, IRQ: 11, Board Id (BLT ID): 16, "
                              "PCI_SLOT_NUMBER: 4, STATE_CHANGE_DATE: Mon Jan  5 14:03:22 2004"),
                   sim::board(2, "B1", "FAMILY: VORN, NAME: VORN-E1")});
        store.make();
    }

    static void set(char const* serial, sim::Json const& fields) {
        sim::command({{"command", "store-set"}, {"serial", serial}, {"fields", fields}});
    }
    static bool isOpen() {
        char name[30];
        return QSBGetDataValue("Family", 2, 0, sizeof name, name) != QSB_EFUNSEQ;
    }

    sim::Store store;
};

TEST_F(QSBBoardTest, TextsAreThoseOfTheRecord) {
    QSBBoard board("A1");
    EXPECT_EQ(board.SerialNumber(), "A1");
    EXPECT_EQ(board.Model(), "NX5-T1");
    EXPECT_EQ(board.Version(), KVL::kQSBBoardLayout);
    EXPECT_EQ(board.FirmwareName(), "nx5.fw");
    EXPECT_EQ(board.FirmwareVersion(), "4.2");
    EXPECT_EQ(board.FunctionalDescription(), "Trunk board");
    EXPECT_EQ(board.DeviceChangeDate(), "Mon Jan  5 14:03:22 2004");
}

TEST_F(QSBBoardTest, NumbersAreThoseOfTheRecord) {
    QSBBoard board("A1");
    EXPECT_EQ(board.Type(), 200);
    EXPECT_EQ(board.SharedMemoryBaseAddress(), -0x30000000);
    EXPECT_EQ(board.IOBaseAddress(), 0xE800);
    EXPECT_EQ(board.IRQ(), 11);
    EXPECT_EQ(board.BoardID(), 16);
    EXPECT_EQ(board.PCISlotNumber(), 4);
}

TEST_F(QSBBoardTest, NumbersAreSigned) {
    set("A1", {{"IRQ", INT_MIN}, {"Type", INT_MAX}, {"BoardID", 4294967294}});
    QSBBoard board("A1");
    EXPECT_EQ(board.IRQ(), INT_MIN);
    EXPECT_EQ(board.Type(), INT_MAX);
    EXPECT_EQ(board.BoardID(), -2);
}

TEST_F(QSBBoardTest, UnknownSerialNumberAnswersErrorAndMinusOne) {
    QSBBoard board("C1");
    EXPECT_EQ(board.Model(), "Error");
    EXPECT_EQ(board.SerialNumber(), "Error");
    EXPECT_EQ(board.IRQ(), -1);
}

TEST_F(QSBBoardTest, LastBoardClosesTheStoreAndANewOneOpensItAgain) {
    auto first = std::make_unique<QSBBoard>("A1");
    auto second = std::make_unique<QSBBoard>("B1");
    first.reset();
    EXPECT_TRUE(isOpen());
    second.reset();
    EXPECT_FALSE(isOpen());
    sim::command({{"command", "store-add"}, {"serial", "NEW"}, {"family", "Z7"}});
    QSBBoard again("NEW");
    EXPECT_TRUE(isOpen());
    EXPECT_EQ(again.SerialNumber(), "NEW");
}

TEST_F(QSBBoardTest, GetterFindsABoardThatWasAddedMeanwhile) {
    QSBBoard board("NEW");
    ASSERT_EQ(board.Model(), "Error");
    sim::command({{"command", "store-add"},
                  {"serial", "NEW"},
                  {"family", "Z7"},
                  {"fields", {{"Model", "Z7-E1"}}}});
    EXPECT_EQ(board.Model(), "Z7-E1");
}

TEST_F(QSBBoardTest, GetterReadsTheFieldAnew) {
    QSBBoard board("A1");
    ASSERT_EQ(board.FirmwareVersion(), "4.2");
    set("A1", {{"FirmwareVersion", "5.0"}});
    EXPECT_EQ(board.FirmwareVersion(), "5.0");
}

TEST_F(QSBBoardTest, RemovedRecordAnswersErrorUntilTheInstanceIsLookedUpAgain) {
    QSBBoard board("A1");
    sim::command({{"command", "store-remove"}, {"serial", "A1"}});
    sim::command({{"command", "store-add"}, {"serial", "A1"}, {"fields", {{"Model", "second"}}}});
    EXPECT_EQ(board.Model(), "Error"); // it keeps the instance that has gone
    board.UpdateInstanceID();
    EXPECT_EQ(board.Model(), "second");
}

TEST_F(QSBBoardTest, GetterOpensAStoreThatCouldNotBeOpened) {
    std::filesystem::remove(store.file());
    std::filesystem::create_directory(store.file());
    QSBBoard board("A1");
    ASSERT_EQ(board.IRQ(), -1);
    std::filesystem::remove(store.file());
    EXPECT_EQ(board.IRQ(), 11);
}

TEST_F(QSBBoardTest, TextWithoutTerminatorEndsWithItsField) {
    store.sql("UPDATE record SET data = CAST(substr(data, 1, 80) || CAST('" + std::string(80, 'm') +
              "' AS BLOB) || substr(data, 161) AS BLOB) WHERE type = 'Board'");
    EXPECT_EQ(QSBBoard("A1").Model(), std::string(80, 'm'));
}

TEST_F(QSBBoardTest, MissingAttributesOfTheChassisAreEmptyAndMinusOne) {
    QSBBoard board("B1");
    EXPECT_EQ(board.FirmwareName(), "");
    EXPECT_EQ(board.PCISlotNumber(), -1);
}

} // namespace
