// SPDX-License-Identifier: BSD-2-Clause
#include "tests/fuzz/DatabaseFile.h"

#include <fstream>
#include <iterator>

#include <sqlite3.h>

namespace fuzz {

namespace {

constexpr int kMaxPatches = 32;
constexpr int kMaxRows = 16;

std::string patched(FuzzInput& input, std::string file) {
    for (int i = 0; i < kMaxPatches && !input.atEnd(); ++i) {
        // Most of what matters is in the first octets of a page.
        std::size_t const page = input.octet();
        std::size_t const at = page * 512 + input.octet();
        std::string const octets = input.text();
        if (at < file.size()) file.replace(at, std::min(octets.size(), file.size() - at), octets);
    }
    return file;
}

void bind(sqlite3_stmt* statement, int parameter, FuzzInput& input) {
    switch (input.choice(5)) {
    case 0:
        sqlite3_bind_int64(statement, parameter, static_cast<std::int8_t>(input.octet()));
        break;
    case 1:
        sqlite3_bind_int64(statement, parameter, input.number<std::int64_t>());
        break;
    case 2: {
        std::string const text = input.text();
        sqlite3_bind_text(statement, parameter, text.data(), static_cast<int>(text.size()),
                          SQLITE_TRANSIENT);
        break;
    }
    case 3: { // of the sizes of the attribute store's records, among others
        static constexpr int kSizes[] = {0, 1, 29, 30, 31, 2127, 2128, 2129};
        std::string bytes = input.text();
        bytes.resize(static_cast<std::size_t>(kSizes[input.choice(std::size(kSizes))]));
        sqlite3_bind_blob(statement, parameter, bytes.data(), static_cast<int>(bytes.size()),
                          SQLITE_TRANSIENT);
        break;
    }
    default:
        sqlite3_bind_null(statement, parameter);
    }
}

void addRow(sqlite3* database, std::string const& table, FuzzInput& input) {
    sqlite3_stmt* look = nullptr;
    if (sqlite3_prepare_v2(database, ("SELECT * FROM " + table).c_str(), -1, &look, nullptr) !=
        SQLITE_OK)
        return;
    int const columns = sqlite3_column_count(look);
    sqlite3_finalize(look);
    std::string sql = "INSERT OR REPLACE INTO " + table + " VALUES (?";
    for (int i = 1; i < columns; ++i)
        sql += ", ?";
    sqlite3_stmt* insert = nullptr;
    if (sqlite3_prepare_v2(database, (sql + ")").c_str(), -1, &insert, nullptr) != SQLITE_OK)
        return;
    for (int i = 1; i <= columns; ++i)
        bind(insert, i, input);
    sqlite3_step(insert);
    sqlite3_finalize(insert);
}

std::string withRows(FuzzInput& input, std::string const& sound,
                     std::vector<std::string> const& tables) {
    sqlite3* database = nullptr;
    sqlite3_open(":memory:", &database);
    auto* const copy = static_cast<unsigned char*>(sqlite3_malloc64(sound.size()));
    sound.copy(reinterpret_cast<char*>(copy), sound.size());
    auto const size = static_cast<sqlite3_int64>(sound.size());
    sqlite3_deserialize(database, "main", copy, size, size,
                        SQLITE_DESERIALIZE_FREEONCLOSE | SQLITE_DESERIALIZE_RESIZEABLE);
    sqlite3_exec(database, "PRAGMA ignore_check_constraints = 1; BEGIN", nullptr, nullptr, nullptr);
    for (int i = 0; i < kMaxRows && !input.atEnd(); ++i)
        addRow(database, tables[input.choice(tables.size())], input);
    sqlite3_exec(database, "COMMIT", nullptr, nullptr, nullptr);
    sqlite3_int64 made = 0;
    unsigned char* const octets = sqlite3_serialize(database, "main", &made, 0);
    std::string file;
    if (octets != nullptr)
        file.assign(reinterpret_cast<char const*>(octets), static_cast<std::size_t>(made));
    sqlite3_free(octets);
    sqlite3_close(database);
    return file;
}

} // namespace

std::string databaseFile(FuzzInput& input, std::string const& sound,
                         std::vector<std::string> const& tables) {
    switch (input.choice(4)) {
    case 0:
        return std::string(input.rest());
    case 1:
        return patched(input, sound);
    default:
        return withRows(input, sound, tables);
    }
}

std::string contentsOf(std::string const& path) {
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
}

void writeFile(std::string const& path, std::string const& contents) {
    std::ofstream(path, std::ios::binary) << contents;
}

} // namespace fuzz
