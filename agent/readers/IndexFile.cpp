// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/IndexFile.h"

#include <ctime>
#include <filesystem>
#include <stdexcept>
#include <string_view>
#include <system_error>
#include <utility>

#include <sqlite3.h>

#include "agent/log/Log.h"

namespace kvloamd {

namespace {

constexpr std::int64_t kApplicationId = 0x4b764978; // "KvIx"
constexpr std::int64_t kVersion = 1;

// Whatever is numbered: the names of the first use are in the files of all agents.
constexpr char kSchema[] =
    "CREATE TABLE block ("
    " first INTEGER PRIMARY KEY CHECK (first > 0),"
    " size INTEGER NOT NULL CHECK (size > 0 AND first + size - 1 <= 2147483647),"
    " serialNumber TEXT NOT NULL);"
    "CREATE TABLE interface ("
    " serialNumber TEXT NOT NULL,"
    " kind INTEGER NOT NULL,"
    " name TEXT NOT NULL,"
    " ifIndex INTEGER NOT NULL UNIQUE,"
    " PRIMARY KEY (serialNumber, kind, name)) WITHOUT ROWID;"
    "PRAGMA application_id = 1266043256;"
    "PRAGMA user_version = 1;";
/// An addition that a program which does not know it leaves alone; so the version stays.
constexpr char kAddedSchema[] = "CREATE TABLE IF NOT EXISTS setting ("
                                " ifIndex INTEGER NOT NULL,"
                                " setting INTEGER NOT NULL,"
                                " value INTEGER NOT NULL,"
                                " PRIMARY KEY (ifIndex, setting)) WITHOUT ROWID;";
static_assert(kApplicationId == 1266043256 && kVersion == 1 && kLastIndex == 2147483647);

/// The file can not be used now.
class Unusable : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

/// The file is no file of ours, or not as we left it.
class Damaged : public std::runtime_error {
  public:
    using std::runtime_error::runtime_error;
};

[[noreturn]] void fail(sqlite3* database) {
    std::string const why = sqlite3_errmsg(database);
    switch (sqlite3_errcode(database)) {
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
    case SQLITE_ERROR:    // a table or column is missing
    case SQLITE_MISMATCH: // a value of another type
        throw Damaged(why);
    case SQLITE_BUSY:
        throw Unusable("another process uses it");
    default:
        throw Unusable(why);
    }
}

class Statement {
  public:
    Statement(sqlite3* database, char const* sql) : m_database(database) {
        if (sqlite3_prepare_v2(database, sql, -1, &m_statement, nullptr) != SQLITE_OK)
            fail(database);
    }
    ~Statement() { sqlite3_finalize(m_statement); }
    Statement(Statement const&) = delete;
    Statement& operator=(Statement const&) = delete;

    /// `value` stays until the next `run`.
    Statement& bind(int parameter, std::string const& value) {
        sqlite3_bind_text(m_statement, parameter, value.data(), static_cast<int>(value.size()),
                          SQLITE_STATIC);
        return *this;
    }
    Statement& bind(int parameter, std::int64_t value) {
        sqlite3_bind_int64(m_statement, parameter, value);
        return *this;
    }
    bool step() {
        int const result = sqlite3_step(m_statement);
        if (result != SQLITE_ROW && result != SQLITE_DONE) fail(m_database);
        return result == SQLITE_ROW;
    }
    void run() {
        step();
        sqlite3_reset(m_statement);
    }
    std::int64_t number(int column) const { return sqlite3_column_int64(m_statement, column); }
    std::string text(int column) const {
        auto const* const bytes =
            reinterpret_cast<char const*>(sqlite3_column_text(m_statement, column));
        return bytes == nullptr ? std::string() : std::string(bytes);
    }

  private:
    sqlite3* m_database;
    sqlite3_stmt* m_statement = nullptr;
};

void execute(sqlite3* database, char const* sql) {
    if (sqlite3_exec(database, sql, nullptr, nullptr, nullptr) != SQLITE_OK) fail(database);
}

std::int64_t numberOf(sqlite3* database, char const* sql) {
    Statement statement(database, sql);
    return statement.step() ? statement.number(0) : 0;
}

/// All or nothing.
class Transaction {
  public:
    explicit Transaction(sqlite3* database) : m_database(database) {
        execute(database, "BEGIN EXCLUSIVE");
    }
    ~Transaction() {
        if (!m_done) sqlite3_exec(m_database, "ROLLBACK", nullptr, nullptr, nullptr);
    }
    Transaction(Transaction const&) = delete;
    Transaction& operator=(Transaction const&) = delete;

    void commit() {
        execute(m_database, "COMMIT");
        m_done = true;
    }

  private:
    sqlite3* m_database;
    bool m_done = false;
};

std::string dateText() {
    std::time_t const now = std::time(nullptr);
    std::tm utc{};
    gmtime_r(&now, &utc);
    char text[32];
    std::strftime(text, sizeof text, "%Y%m%dT%H%M%SZ", &utc);
    return text;
}

/// The state directory holds keys too.
void makeDirectory(std::filesystem::path const& directory) {
    std::error_code ignored; // what can not be made can not be opened either
    if (!directory.empty() && std::filesystem::create_directories(directory, ignored))
        std::filesystem::permissions(directory, std::filesystem::perms::owner_all, ignored);
}

} // namespace

void IndexFile::Close::operator()(sqlite3* database) const {
    sqlite3_close(database);
}

IndexFile::IndexFile(std::string path, std::string things)
    : m_path(std::move(path)), m_things(std::move(things)) {
    if (m_path.empty()) return;
    try {
        makeDirectory(std::filesystem::path(m_path).parent_path());
        try {
            open();
        } catch (Damaged const& error) {
            setAside(error.what());
            open();
        }
    } catch (std::runtime_error const& error) {
        giveUp(error.what());
    }
}

void IndexFile::open() {
    m_records = {};
    sqlite3* database = nullptr;
    int const result = sqlite3_open_v2(m_path.c_str(), &database,
                                       SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr);
    m_database.reset(database);
    if (database == nullptr) throw Unusable("out of memory");
    if (result != SQLITE_OK) fail(database);
    // The lock that the first transaction takes stays until the file is closed.
    execute(database, "PRAGMA locking_mode = EXCLUSIVE");
    Transaction transaction(database);
    if (numberOf(database, "SELECT count(*) FROM sqlite_master") == 0 &&
        numberOf(database, "PRAGMA application_id") == 0)
        execute(database, kSchema);
    checkContents();
    execute(database, kAddedSchema);
    readContents();
    transaction.commit();
}

void IndexFile::checkContents() {
    sqlite3* const database = m_database.get();
    if (numberOf(database, "PRAGMA application_id") != kApplicationId)
        throw Damaged("it is another program's");
    if (numberOf(database, "PRAGMA user_version") != kVersion)
        throw Damaged("it is of another version");
    Statement check(database, "PRAGMA quick_check(1)");
    check.step();
    if (check.text(0) != "ok") throw Damaged(check.text(0));
    if (numberOf(database, "SELECT count(*) FROM interface i WHERE NOT EXISTS (SELECT 1 FROM block"
                           " WHERE serialNumber = i.serialNumber AND i.ifIndex >= first"
                           " AND i.ifIndex < first + size)") != 0)
        throw Damaged("an index is in no block of its board");
    if (numberOf(database, "SELECT count(*) FROM (SELECT first, lag(first + size) OVER (ORDER BY"
                           " first) AS free FROM block) WHERE free > first") != 0)
        throw Damaged("blocks of indices overlap");
}

void IndexFile::readContents() {
    Statement blocks(m_database.get(),
                     "SELECT serialNumber, first, size FROM block ORDER BY first");
    while (blocks.step())
        m_records.blocks.push_back({blocks.text(0), static_cast<std::uint32_t>(blocks.number(1)),
                                    static_cast<std::uint32_t>(blocks.number(2))});
    Statement entries(m_database.get(),
                      "SELECT serialNumber, kind, name, ifIndex FROM interface ORDER BY ifIndex");
    while (entries.step())
        m_records.entries.push_back({entries.text(0),
                                     {static_cast<IndexKind>(entries.number(1)), entries.text(2)},
                                     static_cast<std::uint32_t>(entries.number(3))});
    Statement settings(m_database.get(),
                       "SELECT setting, ifIndex, value FROM setting ORDER BY setting, ifIndex");
    while (settings.step())
        m_records.settings.push_back({{static_cast<Setting>(settings.number(0)),
                                       static_cast<std::uint32_t>(settings.number(1))},
                                      static_cast<int>(settings.number(2))});
}

void IndexFile::add(IndexRecords const& records) {
    if (!m_database) return;
    try {
        Transaction transaction(m_database.get());
        Statement block(m_database.get(),
                        "INSERT INTO block (serialNumber, first, size) VALUES (?, ?, ?)");
        for (IndexBlock const& added : records.blocks)
            block.bind(1, added.serialNumber).bind(2, added.first).bind(3, added.size).run();
        Statement entry(m_database.get(),
                        "INSERT INTO interface (serialNumber, kind, name, ifIndex)"
                        " VALUES (?, ?, ?, ?)");
        for (IndexEntry const& added : records.entries)
            entry.bind(1, added.serialNumber)
                .bind(2, static_cast<std::int64_t>(added.key.kind))
                .bind(3, added.key.name)
                .bind(4, added.index)
                .run();
        Statement set(m_database.get(),
                      "INSERT OR REPLACE INTO setting (ifIndex, setting, value) VALUES (?, ?, ?)");
        Statement forget(m_database.get(), "DELETE FROM setting WHERE ifIndex = ? AND setting = ?");
        for (SettingEntry const& changed : records.settings) {
            Statement& statement = changed.value ? set : forget;
            statement.bind(1, changed.key.index)
                .bind(2, static_cast<std::int64_t>(changed.key.setting));
            if (changed.value) statement.bind(3, *changed.value);
            statement.run();
        }
        transaction.commit();
    } catch (std::runtime_error const& error) {
        giveUp(error.what());
    }
}

void IndexFile::setAside(std::string const& why) {
    m_database.reset();
    std::string const aside = m_path + ".damaged-" + dateText();
    std::error_code fault;
    std::filesystem::rename(m_path, aside, fault);
    if (fault) throw Unusable(why + ", and it can not be renamed: " + fault.message());
    // Left behind, it would be taken for the new file's.
    std::filesystem::rename(m_path + "-journal", aside + "-journal", fault);
    log(LogLevel::Warning, m_path + ": the indices of " + m_things + " can not be read (" + why +
                               "); the file is kept as " + aside + ", " + m_things +
                               " are numbered anew, and what was set for them is lost");
}

void IndexFile::giveUp(std::string const& why) {
    m_database.reset();
    m_records = {};
    log(LogLevel::Warning, m_path + ": the indices of " + m_things +
                               " and what is set for them are not kept across restarts: " + why +
                               "; check --persistent-dir");
}

} // namespace kvloamd
