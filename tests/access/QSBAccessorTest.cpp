// SPDX-License-Identifier: BSD-2-Clause
// The accessor of the attribute store, with the simulated store.
#include "access/QSBAccessor.h"

#include <fstream>

#include "tests/support/SimulatedPlatform.h"
#include "tests/support/SimulatedStore.h"

namespace {

class QSBAccessorTest : public testing::Test {
  protected:
    QSBAccessorTest() {
        sim::load({sim::board(1, "A1", "FAMILY: NX5"), sim::board(2, "A2", "FAMILY: NX5"),
                   sim::board(3, "B1", "FAMILY: VORN")});
        store.make();
    }

    static int find(QSBAccessor& accessor, char const* family, int& instance) {
        return accessor.FindFamilyID(const_cast<char*>(family), &instance);
    }
    static bool isOpen() {
        char name[30];
        return QSBGetDataValue("Family", 2, 0, sizeof name, name) != QSB_EFUNSEQ;
    }
    static void remove(char const* what, char const* name) {
        sim::command({{"command", "store-remove"}, {what, name}});
    }

    sim::Store store;
};

TEST_F(QSBAccessorTest, OpeningLeavesTheDirectoryThatIsSet) {
    std::string const before = getenv("VQRXCFGPATH");
    QSBAccessor const accessor;
    EXPECT_EQ(getenv("VQRXCFGPATH"), before);
}

TEST_F(QSBAccessorTest, OpeningSetsTheDirectoryThatIsNotSet) {
    unsetenv("VQRXCFGPATH");
    QSBAccessor const accessor;
    EXPECT_STREQ(getenv("VQRXCFGPATH"), "/usr/velquor/cfg");
}

TEST_F(QSBAccessorTest, EmptyDirectoryIsLeftEmpty) {
    setenv("VQRXCFGPATH", "", 1);
    QSBAccessor const accessor;
    EXPECT_STREQ(getenv("VQRXCFGPATH"), "");
    EXPECT_FALSE(isOpen());
}

TEST_F(QSBAccessorTest, FirstAccessorOpensTheStore) {
    EXPECT_FALSE(isOpen());
    QSBAccessor const accessor;
    EXPECT_TRUE(isOpen());
}

TEST_F(QSBAccessorTest, StoreStaysOpenUntilTheLastAccessorGoes) {
    auto first = std::make_unique<QSBAccessor>();
    auto second = std::make_unique<QSBAccessor>();
    first.reset();
    EXPECT_TRUE(isOpen());
    EXPECT_NE(second->GetBoardInstance("A1"), -1);
    second.reset();
    EXPECT_FALSE(isOpen());
}

TEST_F(QSBAccessorTest, LastAccessorEmptiesTheMap) {
    { QSBAccessor const accessor; }
    setenv("VQRXCFGPATH", "/proc", 1);
    QSBAccessor accessor; // cannot open
    EXPECT_EQ(accessor.GetBoardInstance("A1"), -1);
}

TEST_F(QSBAccessorTest, BoardsOfAllFamiliesAreMapped) {
    QSBAccessor accessor;
    int const first = accessor.GetBoardInstance("A1");
    int const second = accessor.GetBoardInstance("A2");
    int const other = accessor.GetBoardInstance("B1");
    EXPECT_GT(first, 0);
    EXPECT_GT(second, first);
    EXPECT_GT(other, second);
}

TEST_F(QSBAccessorTest, UnknownSerialNumberHasNoInstance) {
    QSBAccessor accessor;
    EXPECT_EQ(accessor.GetBoardInstance("C1"), -1);
    EXPECT_EQ(accessor.GetBoardInstance(""), -1);
}

TEST_F(QSBAccessorTest, FamilyIsFoundByItsName) {
    QSBAccessor accessor;
    int instance = 0;
    EXPECT_EQ(find(accessor, "VORN", instance), 0);
    char name[30] = {};
    ASSERT_EQ(QSBGetDataValue("Family", instance, 0, sizeof name, name), QSB_SUCCESS);
    EXPECT_STREQ(name, "VORN");
}

TEST_F(QSBAccessorTest, UnknownFamilyAnswersOneAndNoInstance) {
    QSBAccessor accessor;
    int instance = 0;
    EXPECT_EQ(find(accessor, "NX", instance), 1);
    EXPECT_EQ(instance, -1);
}

TEST_F(QSBAccessorTest, FamilyThatIsNotInTheStoreIsSkipped) {
    remove("family", "NX5");
    QSBAccessor accessor;
    EXPECT_EQ(accessor.GetBoardInstance("A1"), -1);
    EXPECT_NE(accessor.GetBoardInstance("B1"), -1);
}

TEST_F(QSBAccessorTest, StoreWithoutFamiliesMapsNothing) {
    store.sql("DELETE FROM record WHERE type = 'Family'");
    QSBAccessor accessor;
    EXPECT_EQ(accessor.GetBoardInstance("B1"), -1);
}

TEST_F(QSBAccessorTest, FamilyWithoutBoardsIsPassed) {
    remove("serial", "A1");
    remove("serial", "A2");
    QSBAccessor accessor;
    int instance = 0;
    EXPECT_EQ(find(accessor, "NX5", instance), 0);
    EXPECT_NE(accessor.GetBoardInstance("B1"), -1);
}

TEST_F(QSBAccessorTest, FamilyOfNoKnownNameIsNotSearched) {
    sim::command({{"command", "store-add"}, {"serial", "X1"}, {"family", "OTHER"}});
    QSBAccessor accessor;
    EXPECT_EQ(accessor.GetBoardInstance("X1"), -1);
}

TEST_F(QSBAccessorTest, FirstOfTwoFamiliesWithOneNameCounts) {
    store.sql("INSERT INTO record (type, parent, data) SELECT type, parent, data FROM record "
              "WHERE type = 'Family' AND substr(data, 1, 4) = x'564f524e'");
    QSBAccessor accessor;
    EXPECT_NE(accessor.GetBoardInstance("B1"), -1);
}

TEST_F(QSBAccessorTest, FamilyNameWithoutTerminatorIsNotTakenForAnother) {
    // 30 bytes, of which the first four read VORN.
    store.sql("UPDATE record SET data = CAST('VORNabcdefghijklmnopqrstuvwxyz' AS BLOB) "
              "WHERE type = 'Family' AND substr(data, 1, 4) = x'564f524e'");
    QSBAccessor accessor;
    int instance = 0;
    EXPECT_EQ(find(accessor, "VORN", instance), 1);
    EXPECT_EQ(find(accessor, "VORNabcdefghijklmnopqrstuvwxyz", instance), 0);
}

TEST_F(QSBAccessorTest, FamilyThatCannotBeReadEndsTheSearch) {
    store.sql("UPDATE record SET data = x'00' WHERE type = 'Family' AND substr(data, 1, 7) = "
              "x'5155494c4c4f4e'");
    QSBAccessor accessor;
    int instance = 0;
    EXPECT_EQ(find(accessor, "NX5", instance), 0);
    EXPECT_EQ(find(accessor, "VORN", instance), 1);
    EXPECT_EQ(instance, -1);
}

TEST_F(QSBAccessorTest, LaterRecordOfOneSerialNumberCounts) {
    store.sql("INSERT INTO record (type, parent, data) SELECT type, parent, data FROM record "
              "WHERE type = 'Board' AND substr(data, 405, 2) = x'4131'");
    QSBAccessor accessor;
    EXPECT_GT(accessor.GetBoardInstance("A1"), accessor.GetBoardInstance("B1"));
}

TEST_F(QSBAccessorTest, SerialNumberWithoutTerminatorEndsWithItsField) {
    std::string const serial(80, 'S');
    store.sql("UPDATE record SET data = CAST(substr(data, 1, 404) || CAST('" + serial +
              "' AS BLOB) || substr(data, 485) AS BLOB) WHERE type = 'Board' AND "
              "substr(data, 405, 2) = x'4131'");
    QSBAccessor accessor;
    EXPECT_NE(accessor.GetBoardInstance(serial), -1);
}

TEST_F(QSBAccessorTest, DamagedRecordIsLeftOutAndTheOthersAreMapped) {
    store.sql("UPDATE record SET data = x'' WHERE type = 'Board' AND "
              "substr(data, 405, 2) = x'4131'");
    QSBAccessor accessor;
    EXPECT_EQ(accessor.GetBoardInstance("A1"), -1);
    EXPECT_NE(accessor.GetBoardInstance("A2"), -1);
}

TEST_F(QSBAccessorTest, UpdateFindsBoardsThatWereAdded) {
    QSBAccessor accessor;
    sim::command({{"command", "store-add"}, {"serial", "NEW"}, {"family", "Z7"}});
    EXPECT_EQ(accessor.GetBoardInstance("NEW"), -1);
    accessor.Update();
    EXPECT_NE(accessor.GetBoardInstance("NEW"), -1);
}

TEST_F(QSBAccessorTest, UpdateOpensAStoreThatHasBecomeReadable) {
    std::filesystem::remove(store.file());
    std::filesystem::create_directory(store.file());
    QSBAccessor accessor;
    ASSERT_FALSE(isOpen());
    std::filesystem::remove(store.file());
    accessor.Update();
    EXPECT_NE(accessor.GetBoardInstance("A1"), -1);
}

TEST_F(QSBAccessorTest, StoreThatIsNoStoreLeavesTheAccessorWithoutBoards) {
    std::ofstream(store.file()) << "something else";
    QSBAccessor accessor;
    EXPECT_FALSE(isOpen());
    EXPECT_EQ(accessor.GetBoardInstance("A1"), -1);
    int instance = 0;
    EXPECT_EQ(find(accessor, "NX5", instance), 1);
}

TEST_F(QSBAccessorTest, ResultNamesFollowTheResults) {
    EXPECT_STREQ(KVL::kQSBResultNames[QSB_SUCCESS], "QSB_SUCCESS");
    EXPECT_STREQ(KVL::kQSBResultNames[QSB_EFUNSEQ], "QSB_EFUNSEQ");
    EXPECT_STREQ(KVL::kQSBResultNames[QSB_ENOSPACE], "QSB_ENOSPACE");
    EXPECT_EQ(std::size(KVL::kQSBResultNames), 11U);
}

} // namespace
