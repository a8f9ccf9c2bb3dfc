// SPDX-License-Identifier: BSD-2-Clause
// An attribute store whose writer was killed in the middle of a change.
#include <unistd.h>

#include <array>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <random>
#include <string>

#include <gmock/gmock.h>

#include "tests/support/ChildProcess.h"
#include "tests/support/SimulatedPlatform.h"
#include "tests/support/SimulatedStore.h"

namespace {

std::string contentOf(std::string const& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

void writeFile(std::string const& path, std::string const& bytes) {
    std::ofstream(path, std::ios::binary) << bytes;
}

class KilledWriterTest : public testing::Test {
  protected:
    KilledWriterTest() {
        kvlsim::loadChassis("boards: [{handle: 1, attributes: {SERIAL_NUMBER: \"A1\", FAMILY: NX5, "
                            "NAME: before}}]");
        store.make();
    }

    std::string journal() const { return store.file() + "-journal"; }

    /// Leaves database and journal as a process does that is killed while it writes the database.
    void leaveHalfAChange() {
        store.sql(
            "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n LIMIT 40) "
            "INSERT INTO record (type, parent, data) SELECT 'Spare', 1, zeroblob(2128) FROM n");
        sqlite3* database = nullptr;
        ASSERT_EQ(sqlite3_open(store.file().c_str(), &database), SQLITE_OK);
        ASSERT_EQ(sqlite3_exec(database,
                               "PRAGMA cache_size = 1; BEGIN IMMEDIATE;"
                               "UPDATE record SET data = zeroblob(length(data));",
                               nullptr, nullptr, nullptr),
                  SQLITE_OK);
        std::string const half = contentOf(store.file());
        std::string const undo = contentOf(journal());
        sqlite3_close(database);
        ASSERT_NE(contentOf(store.file()), half);
        writeFile(store.file(), half);
        writeFile(journal(), undo);
    }

    int open() { return QSBOpenStorage(rootType.data(), &root); }
    std::string model(int board) {
        std::array<char, 80> text{};
        int const result = QSBGetDataValue("Board", board, 80, 80, text.data());
        return result == QSB_SUCCESS ? text.data() : "result " + std::to_string(result);
    }
    int board(std::string const& serial) {
        return sim::command(
            {{"command", "store-list"}, {"serial", serial}})["boards"][0]["instance"];
    }

    sim::Store store;
    std::array<char, kQSBTypeNameSize> rootType{};
    int root = 0;
};

TEST_F(KilledWriterTest, ReaderFindsTheStoreAsItWasBeforeTheChange) {
    int const first = board("A1");
    leaveHalfAChange();
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(model(first), "before");
    EXPECT_FALSE(std::filesystem::exists(journal()));
}

TEST_F(KilledWriterTest, ReaderThatWasOpenBeforeGoesOn) {
    int const first = board("A1");
    ASSERT_EQ(open(), QSB_SUCCESS);
    EXPECT_EQ(model(first), "before");
    leaveHalfAChange();
    EXPECT_EQ(model(first), "before");
}

TEST_F(KilledWriterTest, ListFindsTheStoreAsItWasBeforeTheChange) {
    leaveHalfAChange();
    auto const reply = kvlsim::execute({{"command", "store-list"}, {"serial", "A1"}});
    ASSERT_EQ(reply["ok"], true) << reply;
    EXPECT_EQ(reply["boards"][0]["fields"]["Model"], "before");
}

TEST_F(KilledWriterTest, ReaderWithoutTheRightToWriteSaysWhatToDo) {
    leaveHalfAChange();
    namespace fs = std::filesystem;
    using fs::perms;
    fs::permissions(fs::path(store.directory()).parent_path(), perms(0755));
    fs::permissions(store.directory(), perms(0555));
    fs::permissions(store.file(), perms(0444));
    fs::permissions(journal(), perms(0444));
    support::Finished const reader =
        support::run({KVLSIM_STORE_PROCESS, "read", store.directory()});
    fs::permissions(store.directory(), perms(0755));
    EXPECT_EQ(reader.out,
              store.file() +
                  ": a process was killed while it changed the store, and this process "
                  "cannot undo the change (attempt to write a readonly database); run "
                  "\"kvlsim store list\" on a platform whose user may write the file and "
                  "its directory\n");
}

TEST_F(KilledWriterTest, StoreIsReadableAfterEveryKillAtARandomMoment) {
    std::filesystem::remove(store.file());
    std::mt19937 random(4711);
    int halfChanges = 0;
    for (int round = 0; round < 200; ++round) {
        support::ChildProcess writer({KVLSIM_STORE_PROCESS, "write", store.directory()}, {});
        ASSERT_EQ(writer.readLine(), "writing");
        // The moment of the kill is random; nothing waits for anything here.
        usleep(static_cast<useconds_t>(random() % 12000));
        writer.kill();
        writer.finish();
        if (std::filesystem::exists(journal())) ++halfChanges;
        ASSERT_EQ(open(), QSB_SUCCESS) << "round " << round;
        ASSERT_EQ(QSBCloseStorage(), QSB_SUCCESS);
        auto const reply = kvlsim::execute({{"command", "store-list"}});
        ASSERT_EQ(reply["ok"], true) << reply << " in round " << round;
        ASSERT_EQ(reply["boards"].size(), 20) << "round " << round;
        for (auto const& each : reply["boards"]) {
            std::string const text = each["fields"]["Model"];
            ASSERT_TRUE(text.empty() || text.starts_with("model ")) << text;
        }
    }
    RecordProperty("half_changes", halfChanges);
}

} // namespace
