// SPDX-License-Identifier: BSD-2-Clause
// The simulated attribute store: the operator's changes.

#include "simulator/base/Text.h"
#include "simulator/store/AttributeStore.h"
#include "simulator/store/StoreFile.h"

namespace kvlsim {

namespace {

/// A `Found` is a record that a look-up has found.
struct Found {
    std::int64_t instance;
    BoardRecord record;
};

bool isWhole(std::string_view record) {
    return record.size() == static_cast<std::size_t>(kBoardRecord.size);
}

/// All boards with this serial number: a store that others have written may have several.
std::vector<Found> boardsWith(Database& database, std::string const& serial) {
    std::vector<Found> found;
    Statement all(database, "SELECT instance, data FROM record WHERE type = 'Board'");
    while (all.step()) {
        if (!isWhole(all.bytes(1))) continue;
        BoardRecord record{std::string(all.bytes(1))};
        if (record.serialNumber() == serial) found.push_back({all.integer(0), std::move(record)});
    }
    return found;
}

std::vector<Found> presentBoards(Database& database, std::string const& serial) {
    auto found = boardsWith(database, serial);
    if (found.empty())
        throw StoreError("no record with serial number " + inQuotes(serial) +
                         " in the store; \"kvlsim store list\" lists what is there");
    return found;
}

std::vector<std::int64_t> familiesCalled(Database& database, std::string const& name) {
    std::vector<std::int64_t> found;
    Statement all(database, "SELECT instance, data FROM record WHERE type = 'Family' "
                            "ORDER BY instance");
    while (all.step())
        if (familyName(all.bytes(1)) == name) found.push_back(all.integer(0));
    return found;
}

void run(Database& database, char const* sql, std::int64_t instance) {
    Statement statement(database, sql);
    statement.bind(1, instance);
    statement.step();
}

StoreListing listIn(Database database) {
    StoreListing listing;
    database.execute("BEGIN"); // families and boards of one moment
    Statement families(database, "SELECT instance, data FROM record WHERE type = 'Family' "
                                 "ORDER BY instance");
    while (families.step())
        listing.families.emplace_back(families.integer(0), familyName(families.bytes(1)));
    Statement boards(database, "SELECT instance, data FROM record "
                               "WHERE type = 'Board' AND parent = ?1 ORDER BY instance");
    for (auto const& [family, name] : listing.families) {
        Execution const execution(boards);
        boards.bind(1, family);
        while (boards.step())
            if (isWhole(boards.bytes(1)))
                listing.boards.push_back(
                    {boards.integer(0), name, BoardRecord(std::string(boards.bytes(1)))});
    }
    return listing;
}

} // namespace

template <typename Change>
void AttributeStore::change(Change change) {
    std::lock_guard const lock(m_mutex);
    try {
        Database database = openFile(DatabaseUse::change);
        // The connection is closed, which rolls an uncommitted change back.
        database.execute("BEGIN IMMEDIATE");
        change(database);
        database.execute("COMMIT");
    } catch (DatabaseError const& error) {
        throw StoreError(path() + ": " + oneLine(error.what()));
    }
}

StoreListing AttributeStore::list() {
    std::lock_guard const lock(m_mutex);
    std::string const file = path();
    try {
        return undoingUnfinished([&] {
            StoreListing listing = listIn(openFile(DatabaseUse::read));
            listing.path = file;
            return listing;
        });
    } catch (DatabaseError const& error) {
        throw StoreError(file + ": " + oneLine(error.what()));
    }
}

void AttributeStore::add(StoreBoard const& board) {
    change([&](Database& database) {
        std::string const serial = board.record.serialNumber();
        if (!boardsWith(database, serial).empty())
            throw StoreError("serial number " + inQuotes(serial) +
                             " is in the store already; set its fields or remove it");
        auto const families = familiesCalled(database, board.family);
        std::int64_t const family =
            families.empty()
                ? addRecord(database, kFamilyRecord, kRootInstance, familyRecord(board.family))
                : families.front();
        addRecord(database, kBoardRecord, family, board.record.bytes());
    });
}

void AttributeStore::addFamily(std::string const& name) {
    change([&](Database& database) {
        if (!familiesCalled(database, name).empty())
            throw StoreError("family " + inQuotes(name) + " is in the store already");
        addRecord(database, kFamilyRecord, kRootInstance, familyRecord(name));
    });
}

void AttributeStore::set(std::string const& serial, FieldValues const& fields) {
    change([&](Database& database) {
        for (auto& [instance, record] : presentBoards(database, serial)) {
            for (auto const& [field, value] : fields)
                record.set(*field, value);
            Statement update(database, "UPDATE record SET data = ?2 WHERE instance = ?1");
            update.bind(1, instance);
            update.bindBytes(2, record.bytes());
            update.step();
        }
    });
}

void AttributeStore::remove(std::string const& serial) {
    change([&](Database& database) {
        for (auto const& board : presentBoards(database, serial))
            run(database, "DELETE FROM record WHERE instance = ?1", board.instance);
    });
}

void AttributeStore::removeFamily(std::string const& name) {
    change([&](Database& database) {
        auto const families = familiesCalled(database, name);
        if (families.empty())
            throw StoreError("no family " + inQuotes(name) +
                             " in the store; \"kvlsim store list\" lists what is there");
        for (std::int64_t const family : families) {
            run(database, "DELETE FROM record WHERE parent = ?1 AND type = 'Board'", family);
            run(database, "DELETE FROM record WHERE instance = ?1", family);
        }
    });
}

} // namespace kvlsim
