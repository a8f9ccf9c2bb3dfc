// SPDX-License-Identifier: BSD-2-Clause
// The storage library: the answer of each call, and its effect on a damaged file.
#include <array>
#include <climits>
#include <fstream>
#include <iterator>
#include <memory>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include <gmock/gmock.h>

#include "tests/support/ChildProcess.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/SimulatedStore.h"

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

class AttributeStoreTest : public testing::Test {
  protected:
    AttributeStoreTest() {
        sim::load({sim::board(1, "A1", "FAMILY: NX5"), sim::board(2, "A2", "FAMILY: NX5"),
                   sim::board(3, "B1", "FAMILY: MINE"), sim::board(4, "C1")});
    }

    int open() { return QSBOpenStorage(rootType.data(), &root); }

    std::string familyName(int family) {
        std::array<char, 30> name{};
        EXPECT_EQ(QSBGetDataValue("Family", family, 0, 30, name.data()), QSB_SUCCESS);
        return name.data();
    }
    int family(std::string const& name) {
        int at = 0;
        int result = QSBGetFirstInstance("Family", "root", root, &at);
        while (result == QSB_SUCCESS && familyName(at) != name)
            result = QSBGetNextInstance(&at);
        return result == QSB_SUCCESS ? at : -1;
    }
    std::vector<std::string> families() {
        std::vector<std::string> names;
        int at = 0;
        int result = QSBGetFirstInstance("Family", "root", root, &at);
        for (; result == QSB_SUCCESS; result = QSBGetNextInstance(&at))
            names.push_back(familyName(at));
        return names;
    }
    static std::string serial(int board) {
        std::array<char, 80> text{};
        EXPECT_EQ(QSBGetDataValue("Board", board, 404, 80, text.data()), QSB_SUCCESS);
        return text.data();
    }
    std::vector<std::string> boards(std::string const& of) {
        std::vector<std::string> serials;
        int at = 0;
        int result = QSBGetFirstInstance("Board", "Family", family(of), &at);
        for (; result == QSB_SUCCESS; result = QSBGetNextInstance(&at))
            serials.push_back(serial(at));
        return serials;
    }
    int firstBoard(std::string const& of) {
        int at = -1;
        EXPECT_EQ(QSBGetFirstInstance("Board", "Family", family(of), &at), QSB_SUCCESS);
        return at;
    }

    std::string content() const {
        std::ifstream file(store.file(), std::ios::binary);
        return {std::istreambuf_iterator<char>(file), {}};
    }
    void write(std::string const& bytes) const {
        std::ofstream(store.file(), std::ios::binary) << bytes;
    }
    void expectRefusedAndUnchanged() {
        std::string const before = content();
        EXPECT_EQ(open(), QSB_EGENERAL);
        sim::Json const reply = kvlsim::execute({{"command", "store-remove"}, {"family", "NX5"}});
        EXPECT_EQ(reply["ok"], false) << reply;
        EXPECT_EQ(content(), before);
    }

    sim::Store store;
    std::array<char, kQSBTypeNameSize> rootType{};
    int root = 0;
    int instance = 77;
    std::array<char, 80> buffer{};
};

TEST_F(AttributeStoreTest, OpenTellsTheRootRecord) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_STREQ(rootType.data(), "root");
    EXPECT_EQ(root, 1);
}

TEST_F(AttributeStoreTest, StoreIsMadeFromTheChassis) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_THAT(families(), ElementsAre("NX5", "QUILLON", "VORN", "Z7", "VELQUOR", "MINE"));
    EXPECT_THAT(boards("NX5"), ElementsAre("A1", "A2"));
    EXPECT_THAT(boards("MINE"), ElementsAre("B1"));
    EXPECT_THAT(boards("Z7"), IsEmpty());
}

TEST_F(AttributeStoreTest, StoreIsMadeAsTheChassisDescribesIt) {
    kvlsim::loadChassis(R"(
boards:
  - {handle: 1, attributes: {SERIAL_NUMBER: "A1", FAMILY: NX5, NAME: NX5-T1}}
store:
  families: [VORN, NX5]
  boards:
    - serial: "A1"
      fields: {IRQ: 0xFFFFFFFF}
    - {serial: "SPARE", family: VORN}
)");
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_THAT(families(), ElementsAre("VORN", "NX5"));
    EXPECT_THAT(boards("VORN"), ElementsAre("SPARE"));
    int irq = 0;
    ASSERT_EQ(QSBGetDataValue("Board", firstBoard("NX5"), 492, 4, &irq), QSB_SUCCESS);
    EXPECT_EQ(irq, -1);
    ASSERT_EQ(QSBGetDataValue("Board", firstBoard("NX5"), 80, 80, buffer.data()), QSB_SUCCESS);
    EXPECT_STREQ(buffer.data(), "NX5-T1");
}

TEST_F(AttributeStoreTest, StoreThatIsThereIsKept) {
    store.make();
    sim::load({sim::board(9, "OTHER", "FAMILY: NX5")});
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_THAT(boards("NX5"), ElementsAre("A1", "A2"));
}

TEST_F(AttributeStoreTest, MakingLeavesNothingElseBehind) {
    store.make();
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(store.directory()), {}), 1);
}

TEST_F(AttributeStoreTest, OpeningAnOpenStoreChangesNothing) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBCloseStorage(), QSB_SUCCESS);
    EXPECT_EQ(QSBCloseStorage(), QSB_EFUNSEQ);
}

TEST_F(AttributeStoreTest, OpenRefusesNullPointers) {
    EXPECT_EQ(QSBOpenStorage(nullptr, &root), QSB_EINVALID);
    EXPECT_EQ(QSBOpenStorage(rootType.data(), nullptr), QSB_EINVALID);
}

TEST_F(AttributeStoreTest, CallsOnAClosedStoreAreOutOfSequence) {
    EXPECT_EQ(QSBGetFirstInstance("Family", "root", 1, &instance), QSB_EFUNSEQ);
    EXPECT_EQ(QSBGetNextInstance(&instance), QSB_EFUNSEQ);
    EXPECT_EQ(QSBGetDataValue("Family", 2, 0, 30, buffer.data()), QSB_EFUNSEQ);
    EXPECT_EQ(QSBCloseStorage(), QSB_EFUNSEQ);
    EXPECT_EQ(instance, 77);
}

TEST_F(AttributeStoreTest, FirstRefusesAnUnknownType) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetFirstInstance("Shelf", "root", root, &instance), QSB_ENOTYPE);
    EXPECT_EQ(QSBGetFirstInstance("family", "root", root, &instance), QSB_ENOTYPE);
}

TEST_F(AttributeStoreTest, FirstRefusesAParentOfTheWrongType) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetFirstInstance("Board", "root", root, &instance), QSB_ENOPARENTTYPE);
    EXPECT_EQ(QSBGetFirstInstance("Family", "Shelf", root, &instance), QSB_ENOPARENTTYPE);
    EXPECT_EQ(QSBGetFirstInstance("root", "", 0, &instance), QSB_ENOPARENTTYPE);
}

TEST_F(AttributeStoreTest, FirstRefusesAnUnknownParent) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetFirstInstance("Family", "root", 99, &instance), QSB_ENOPARENTINST);
    EXPECT_EQ(QSBGetFirstInstance("Board", "Family", root, &instance), QSB_ENOPARENTINST);
    EXPECT_EQ(QSBGetFirstInstance("Board", "Family", -1, &instance), QSB_ENOPARENTINST);
}

TEST_F(AttributeStoreTest, FirstOfNoneIsNoInstance) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetFirstInstance("Board", "Family", family("Z7"), &instance), QSB_ENOINST);
    EXPECT_EQ(instance, 77);
}

TEST_F(AttributeStoreTest, FirstRefusesNullPointers) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetFirstInstance(nullptr, "root", root, &instance), QSB_EINVALID);
    EXPECT_EQ(QSBGetFirstInstance("Family", nullptr, root, &instance), QSB_EINVALID);
    EXPECT_EQ(QSBGetFirstInstance("Family", "root", root, nullptr), QSB_EINVALID);
}

TEST_F(AttributeStoreTest, NextWithoutFirstIsOutOfSequence) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetNextInstance(&instance), QSB_EFUNSEQ);
}

TEST_F(AttributeStoreTest, NextAfterAFailedFirstIsOutOfSequence) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    firstBoard("NX5");
    ASSERT_EQ(QSBGetFirstInstance("Board", "Family", family("Z7"), &instance), QSB_ENOINST);
    EXPECT_EQ(QSBGetNextInstance(&instance), QSB_EFUNSEQ);
}

TEST_F(AttributeStoreTest, NextAtTheEndIsNoMore) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    int board = firstBoard("MINE");
    int const only = board;
    EXPECT_EQ(QSBGetNextInstance(&board), QSB_ENOMORE);
    EXPECT_EQ(QSBGetNextInstance(&board), QSB_ENOMORE);
    EXPECT_EQ(board, only);
}

TEST_F(AttributeStoreTest, NextRefusesAnInstanceThatTheWalkIsNotAt) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    firstBoard("NX5");
    EXPECT_EQ(QSBGetNextInstance(&instance), QSB_EINVALID);
    EXPECT_EQ(QSBGetNextInstance(nullptr), QSB_EINVALID);
}

TEST_F(AttributeStoreTest, WalkGoesOnBehindARecordThatIsRemoved) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    int board = firstBoard("NX5");
    sim::command({{"command", "store-remove"}, {"serial", "A1"}});
    ASSERT_EQ(QSBGetNextInstance(&board), QSB_SUCCESS);
    EXPECT_EQ(serial(board), "A2");
}

TEST_F(AttributeStoreTest, ValueRefusesAnUnknownType) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetDataValue("Shelf", 2, 0, 4, buffer.data()), QSB_ENOTYPE);
}

TEST_F(AttributeStoreTest, ValueRefusesAnInstanceThatIsNotThere) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetDataValue("Board", 99, 0, 4, buffer.data()), QSB_ENOINST);
    EXPECT_EQ(QSBGetDataValue("Board", family("NX5"), 0, 4, buffer.data()), QSB_ENOINST);
}

TEST_F(AttributeStoreTest, ValueRefusesWhatIsOutsideTheRecord) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    int const board = firstBoard("NX5");
    for (auto const& [offset, length] : std::initializer_list<std::pair<int, int>>{
             {-1, 4}, {0, 0}, {0, -1}, {2128, 1}, {2125, 4}, {0, 2129}, {INT_MAX, INT_MAX}})
        EXPECT_EQ(QSBGetDataValue("Board", board, offset, length, buffer.data()), QSB_EINVALID)
            << offset << ' ' << length;
    EXPECT_EQ(QSBGetDataValue("root", root, 0, 1, buffer.data()), QSB_EINVALID);
}

TEST_F(AttributeStoreTest, ValueRefusesNullPointers) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetDataValue(nullptr, 2, 0, 4, buffer.data()), QSB_EINVALID);
    EXPECT_EQ(QSBGetDataValue("Family", 2, 0, 4, nullptr), QSB_EINVALID);
}

TEST_F(AttributeStoreTest, WholeRecordsCanBeRead) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    std::array<char, 2128> record{};
    record.fill('x');
    ASSERT_EQ(QSBGetDataValue("Board", firstBoard("NX5"), 0, 2128, record.data()), QSB_SUCCESS);
    EXPECT_STREQ(record.data(), "BW1.0_BCI_Struct");
    EXPECT_EQ(record.back(), '\0');
}

TEST_F(AttributeStoreTest, RecordOfTheWrongSizeIsAGeneralError) {
    store.make();
    store.sql("UPDATE record SET data = x'0102' WHERE type = 'Board'");
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(QSBGetDataValue("Board", firstBoard("NX5"), 0, 1, buffer.data()), QSB_EGENERAL);
}

TEST_F(AttributeStoreTest, WithoutADirectoryNothingIsOpened) {
    unsetenv("VQRXCFGPATH");
    EXPECT_EQ(open(), QSB_EGENERAL);
}

TEST_F(AttributeStoreTest, MissingDirectoryIsNotMade) {
    setenv("VQRXCFGPATH", (store.directory() + "/deeper").c_str(), 1);
    EXPECT_EQ(open(), QSB_EGENERAL);
    EXPECT_FALSE(std::filesystem::exists(store.directory() + "/deeper"));
}

TEST_F(AttributeStoreTest, DirectoryThatCannotBeWrittenIsAGeneralError) {
    setenv("VQRXCFGPATH", "/proc", 1); // not even root makes files there
    EXPECT_EQ(open(), QSB_EGENERAL);
}

TEST_F(AttributeStoreTest, TextFileIsRefusedAndStays) {
    write("not a database");
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, EmptyFileIsRefusedAndStays) {
    write("");
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, ForeignDatabaseIsRefusedAndStays) {
    sqlite3* database = nullptr;
    ASSERT_EQ(sqlite3_open(store.file().c_str(), &database), SQLITE_OK);
    sqlite3_exec(database, "PRAGMA journal_mode = WAL; CREATE TABLE record (x)", nullptr, nullptr,
                 nullptr);
    sqlite3_close(database);
    ASSERT_FALSE(content().empty());
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, StoreOfAnotherLayoutIsRefusedAndStays) {
    store.make();
    std::string bytes = content();
    bytes[63] = 2; // the layout's version
    write(bytes);
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, TruncatedStoreIsRefusedAndStays) {
    store.make();
    write(content().substr(0, content().size() / 2));
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, StoreCutInItsHeaderIsRefusedAndStays) {
    store.make();
    write(content().substr(0, 50));
    expectRefusedAndUnchanged();
}

TEST_F(AttributeStoreTest, StoreTruncatedWhileOpenIsAGeneralError) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    int const board = firstBoard("NX5");
    std::filesystem::resize_file(store.file(), 100);
    EXPECT_EQ(QSBGetDataValue("Board", board, 0, 4, buffer.data()), QSB_EGENERAL);
    EXPECT_EQ(QSBGetFirstInstance("Family", "root", root, &instance), QSB_EGENERAL);
    EXPECT_EQ(QSBCloseStorage(), QSB_SUCCESS);
}

TEST_F(AttributeStoreTest, LockedStoreIsAGeneralErrorUntilItIsUnlocked) {
    store.make();
    std::string const before = content();
    sqlite3* database = nullptr;
    ASSERT_EQ(sqlite3_open(store.file().c_str(), &database), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(database, "BEGIN EXCLUSIVE", nullptr, nullptr, nullptr), SQLITE_OK);
    EXPECT_EQ(open(), QSB_EGENERAL);
    sim::Json const reply = kvlsim::execute({{"command", "store-remove"}, {"family", "NX5"}});
    EXPECT_EQ(reply["error"], store.file() + ": database is locked");
    sqlite3_close(database);
    EXPECT_EQ(content(), before);
    EXPECT_EQ(open(), QSB_SUCCESS);
}

TEST_F(AttributeStoreTest, OpeningDoesNotUnlockWhatAnotherHolds) {
    store.make();
    sqlite3* database = nullptr;
    ASSERT_EQ(sqlite3_open(store.file().c_str(), &database), SQLITE_OK);
    ASSERT_EQ(sqlite3_exec(database, "BEGIN EXCLUSIVE", nullptr, nullptr, nullptr), SQLITE_OK);
    EXPECT_EQ(open(), QSB_EGENERAL);
    support::ChildProcess other({KVLSIM_PLATFORM_HOLDER}, {"VQRXCFGPATH=" + store.directory()});
    ASSERT_EQ(other.readLine(), "ready");
    other.writeLine("store");
    EXPECT_EQ(other.readLine(), "result 1");
    sqlite3_close(database);
}

TEST_F(AttributeStoreTest, TwoProcessesReadOneStoreAtOnce) {
    ASSERT_EQ(open(), QSB_SUCCESS);
    support::ChildProcess other({KVLSIM_PLATFORM_HOLDER}, {"VQRXCFGPATH=" + store.directory()});
    ASSERT_EQ(other.readLine(), "ready");
    other.writeLine("store");
    EXPECT_EQ(other.readLine(), "serials A1 A2 B1");
    EXPECT_THAT(boards("NX5"), ElementsAre("A1", "A2"));
    sim::command({{"command", "store-remove"}, {"serial", "A1"}});
    other.writeLine("store");
    EXPECT_EQ(other.readLine(), "serials A2 B1");
}

TEST_F(AttributeStoreTest, ProcessesThatMakeTheStoreAtOnceAgree) {
    std::vector<std::unique_ptr<support::ChildProcess>> others;
    for (int i = 0; i < 4; ++i)
        others.push_back(std::make_unique<support::ChildProcess>(
            std::vector<std::string>{KVLSIM_PLATFORM_HOLDER},
            std::vector<std::string>{"VQRXCFGPATH=" + store.directory()}));
    for (auto& other : others)
        ASSERT_EQ(other->readLine(), "ready");
    for (auto& other : others)
        other->writeLine("store");
    std::string const first = others.front()->readLine();
    EXPECT_EQ(first.substr(0, 16), "serials NX50001 ");
    for (auto& other : std::span(others).subspan(1))
        EXPECT_EQ(other->readLine(), first);
    EXPECT_EQ(std::distance(std::filesystem::directory_iterator(store.directory()), {}), 1);
}

} // namespace
