// SPDX-License-Identifier: BSD-2-Clause
// The file of an attribute store: creating it and recognising it.
#include "simulator/store/StoreFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <map>
#include <string_view>

namespace kvlsim {

namespace {

// An instance is never used again: a reader may still have the instance of a removed record.
constexpr char const* kLayout = "PRAGMA application_id = 1263948099;"
                                "PRAGMA user_version = 1;"
                                "CREATE TABLE record ("
                                "    instance INTEGER PRIMARY KEY AUTOINCREMENT,"
                                "    type TEXT NOT NULL,"
                                "    parent INTEGER NOT NULL,"
                                "    data BLOB NOT NULL);"
                                "CREATE INDEX record_by_parent ON record (parent, type, instance);";

/// A file's header: bytes 18 and 19 are 1 in a file without write-ahead log, from 60 on stands the
/// version of the layout, from 68 on the identification ("KVQC").
bool isStore(std::string_view head) {
    using namespace std::string_view_literals;
    return head.size() == 100 && head.starts_with("SQLite format 3\0"sv) &&
           head.substr(18, 2) == "\1\1"sv && head.substr(60, 4) == "\0\0\0\1"sv &&
           head.substr(68, 4) == "KVQC"sv;
}

[[noreturn]] void failWith(std::string const& what) {
    throw DatabaseError(what + " (" + std::strerror(errno) + ")");
}

/// An `AsideFile` is a temporary file beside `path`, which is removed with its object.
class AsideFile {
  public:
    explicit AsideFile(std::string const& path) : m_path(path + ".XXXXXX") {
        int const file = mkostemp(m_path.data(), O_CLOEXEC);
        if (file < 0) failWith("cannot be made; VQRXCFGPATH must name a writable directory");
        // Other users' processes read the store too.
        fchmod(file, S_IRUSR | S_IWUSR | S_IRGRP | S_IROTH);
        ::close(file);
    }
    ~AsideFile() { unlink(m_path.c_str()); }
    AsideFile(AsideFile const&) = delete;
    AsideFile& operator=(AsideFile const&) = delete;

    std::string const& path() const { return m_path; }

  private:
    std::string m_path;
};

void fill(Database& database, StoreContents const& contents) {
    database.execute("BEGIN");
    database.execute(kLayout);
    std::int64_t const root = addRecord(database, kRootRecord, 0, {});
    if (root != kRootInstance) throw DatabaseError("the root record is not the first");
    std::map<std::string, std::int64_t> families;
    for (auto const& name : contents.families)
        families[name] = addRecord(database, kFamilyRecord, root, familyRecord(name));
    for (auto const& board : contents.boards)
        addRecord(database, kBoardRecord, families.at(board.family), board.record.bytes());
    database.execute("COMMIT");
}

} // namespace

std::int64_t addRecord(Database& database, RecordType const& type, std::int64_t parent,
                       std::string_view record) {
    Statement insert(database, "INSERT INTO record (type, parent, data) VALUES (?1, ?2, ?3) "
                               "RETURNING instance");
    insert.bind(1, type.name);
    insert.bind(2, parent);
    insert.bindBytes(3, record);
    insert.step();
    std::int64_t const instance = insert.integer(0);
    insert.step();
    return instance;
}

void makeStoreFile(std::string const& path, std::function<StoreContents()> const& contents) {
    struct stat found {};
    if (stat(path.c_str(), &found) == 0) return;
    AsideFile const aside(path);
    {
        Database database(aside.path(), DatabaseUse::create);
        fill(database, contents());
    }
    // Not rename: when two processes create the store at once, the first one's file stays.
    if (link(aside.path().c_str(), path.c_str()) != 0 && errno != EEXIST)
        failWith("cannot be made; VQRXCFGPATH must name a writable directory");
}

void undoUnfinishedChange(std::string const& path) {
    try {
        // A connection that may write undoes the change before it begins its own.
        Database(path, DatabaseUse::change).execute("BEGIN IMMEDIATE; ROLLBACK");
    } catch (DatabaseError const& error) {
        throw DatabaseError(std::string("a process was killed while it changed the store, and this "
                                        "process cannot undo the change (") +
                            error.what() +
                            "); run \"kvlsim store list\" on a platform whose user may write the "
                            "file and its directory");
    }
}

Database openStoreFile(std::string const& path, DatabaseUse use) {
    if (!isStore(Database(path, DatabaseUse::read).head(100)))
        throw DatabaseError("is no attribute store; move it away, and a new one is made");
    Database database(path, use);
    try {
        database.execute("SELECT 1 FROM record LIMIT 1");
    } catch (UnfinishedChange const&) {
        undoUnfinishedChange(path);
    }
    return database;
}

} // namespace kvlsim
