// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/IndexTables.h"

namespace kvloamd {

namespace {

// The names of the first version are in the files of all agents: the serial number is the board's
// key, and the table of interfaces has whatever is numbered. An older agent leaves tables alone
// that it does not know, so adding one does not change the file's version.
constexpr char kSchema[] =
    "CREATE TABLE IF NOT EXISTS block ("
    " first INTEGER PRIMARY KEY CHECK (first > 0),"
    " size INTEGER NOT NULL CHECK (size > 0 AND first + size - 1 <= 2147483647),"
    " serialNumber TEXT NOT NULL);"
    "CREATE TABLE IF NOT EXISTS interface ("
    " serialNumber TEXT NOT NULL,"
    " kind INTEGER NOT NULL,"
    " name TEXT NOT NULL,"
    " ifIndex INTEGER NOT NULL UNIQUE,"
    " PRIMARY KEY (serialNumber, kind, name)) WITHOUT ROWID;"
    "CREATE TABLE IF NOT EXISTS seen ("
    " serialNumber TEXT PRIMARY KEY,"
    " day INTEGER NOT NULL) WITHOUT ROWID;"
    "CREATE TABLE IF NOT EXISTS calendar ("
    " id INTEGER PRIMARY KEY CHECK (id = 1),"
    " day INTEGER NOT NULL,"
    " date INTEGER NOT NULL);";
static_assert(kLastIndex == 2147483647);

bool hasTable(Database& database, std::string const& name) {
    Statement statement(database, "SELECT count(*) FROM sqlite_master WHERE name = ?");
    statement.bind(1, name);
    return statement.step() && statement.number(0) > 0;
}

void check(Database& database) {
    if (database.number("SELECT count(*) FROM interface i WHERE NOT EXISTS (SELECT 1 FROM block"
                        " WHERE serialNumber = i.serialNumber AND i.ifIndex >= first"
                        " AND i.ifIndex < first + size)") != 0)
        throw DatabaseDamaged("an index is in no block of its board");
    if (database.number("SELECT count(*) FROM (SELECT first, lag(first + size) OVER (ORDER BY"
                        " first) AS free FROM block) WHERE free > first") != 0)
        throw DatabaseDamaged("blocks of indices overlap");
}

} // namespace

void createIndexTables(Database& database) {
    database.execute(kSchema);
}

IndexRecords readIndexTables(Database& database) {
    IndexRecords records;
    if (database.number("SELECT count(*) FROM sqlite_master") == 0) return records;
    check(database);
    Statement blocks(database, "SELECT serialNumber, first, size FROM block ORDER BY first");
    while (blocks.step())
        records.blocks.push_back({blocks.text(0), static_cast<std::uint32_t>(blocks.number(1)),
                                  static_cast<std::uint32_t>(blocks.number(2))});
    Statement entries(database,
                      "SELECT serialNumber, kind, name, ifIndex FROM interface ORDER BY ifIndex");
    while (entries.step())
        records.entries.push_back({entries.text(0),
                                   {static_cast<IndexKind>(entries.number(1)), entries.text(2)},
                                   static_cast<std::uint32_t>(entries.number(3))});
    if (hasTable(database, "seen")) {
        Statement seen(database, "SELECT serialNumber, day FROM seen");
        while (seen.step())
            records.seen.push_back({seen.text(0), seen.number(1)});
    }
    if (hasTable(database, "calendar")) {
        Statement calendar(database, "SELECT day, date FROM calendar");
        if (calendar.step()) records.calendar = {calendar.number(0), calendar.number(1)};
    }
    return records;
}

void deleteIndices(Database& database) {
    database.execute("DELETE FROM block; DELETE FROM interface; DELETE FROM seen;");
}

void writeIndices(Database& database, IndexRecords const& records) {
    for (char const* const sql : {"DELETE FROM block WHERE serialNumber = ?",
                                  "DELETE FROM interface WHERE serialNumber = ?",
                                  "DELETE FROM seen WHERE serialNumber = ?"}) {
        Statement forget(database, sql);
        for (std::string const& board : records.forgotten)
            forget.bind(1, board).run();
    }
    Statement block(database, "INSERT INTO block (serialNumber, first, size) VALUES (?, ?, ?)");
    for (IndexBlock const& added : records.blocks)
        block.bind(1, added.board).bind(2, added.first).bind(3, added.size).run();
    Statement entry(database, "INSERT INTO interface (serialNumber, kind, name, ifIndex)"
                              " VALUES (?, ?, ?, ?)");
    for (IndexEntry const& added : records.entries)
        entry.bind(1, added.board)
            .bind(2, static_cast<std::int64_t>(added.key.kind))
            .bind(3, added.key.name)
            .bind(4, added.index)
            .run();
    Statement seen(database, "INSERT OR REPLACE INTO seen (serialNumber, day) VALUES (?, ?)");
    for (BoardSeen const& board : records.seen)
        seen.bind(1, board.board).bind(2, board.day).run();
    Statement(database, "INSERT OR REPLACE INTO calendar (id, day, date) VALUES (1, ?, ?)")
        .bind(1, records.calendar.day)
        .bind(2, records.calendar.date)
        .run();
}

} // namespace kvloamd
