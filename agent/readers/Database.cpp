// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Database.h"

#include <algorithm>
#include <ctime>
#include <utility>

#include <sqlite3.h>

namespace kvloamd {

namespace {

std::string inOneLine(std::string text) {
    std::ranges::replace(text, '\n', ' ');
    return text;
}

} // namespace

DatabaseFault::DatabaseFault(std::string why) : std::runtime_error(inOneLine(std::move(why))) {}

Database::Database(std::string const& path) {
    sqlite3* database = nullptr;
    int const result = sqlite3_open_v2(path.c_str(), &database,
                                       SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE, nullptr);
    m_database.reset(database);
    if (database == nullptr) throw DatabaseFault("out of memory");
    if (result != SQLITE_OK) fail();
}

void Database::Close::operator()(sqlite3* database) const {
    sqlite3_close(database);
}

void Database::setPatience(std::chrono::milliseconds patience) {
    sqlite3_busy_timeout(m_database.get(), static_cast<int>(patience.count()));
}

bool Database::isReadOnly() const {
    return sqlite3_db_readonly(m_database.get(), "main") == 1;
}

void Database::execute(char const* sql) {
    if (sqlite3_exec(m_database.get(), sql, nullptr, nullptr, nullptr) != SQLITE_OK) fail();
}

std::int64_t Database::number(char const* sql) {
    Statement statement(*this, sql);
    return statement.step() ? statement.number(0) : 0;
}

void Database::fail() const {
    std::string const why = sqlite3_errmsg(m_database.get());
    switch (sqlite3_errcode(m_database.get())) {
    case SQLITE_CORRUPT:
    case SQLITE_NOTADB:
    case SQLITE_ERROR:      // a table or column is missing
    case SQLITE_MISMATCH:   // a value has another type
    case SQLITE_CONSTRAINT: // an index contains rows that its table does not contain
        throw DatabaseDamaged(why);
    case SQLITE_BUSY:
        throw DatabaseInUse("another process uses it");
    default:
        throw DatabaseFault(why);
    }
}

Statement::Statement(Database& database, char const* sql) : m_database(database) {
    if (sqlite3_prepare_v2(database.m_database.get(), sql, -1, &m_statement, nullptr) != SQLITE_OK)
        database.fail();
}

Statement::~Statement() {
    sqlite3_finalize(m_statement);
}

Statement& Statement::bind(int parameter, std::string const& value) {
    sqlite3_bind_text(m_statement, parameter, value.data(), static_cast<int>(value.size()),
                      SQLITE_STATIC);
    return *this;
}

Statement& Statement::bind(int parameter, std::int64_t value) {
    sqlite3_bind_int64(m_statement, parameter, value);
    return *this;
}

Statement& Statement::bindBlob(int parameter, std::string const& value) {
    sqlite3_bind_blob(m_statement, parameter, value.data(), static_cast<int>(value.size()),
                      SQLITE_STATIC);
    return *this;
}

bool Statement::step() {
    int const result = sqlite3_step(m_statement);
    if (result != SQLITE_ROW && result != SQLITE_DONE) m_database.fail();
    return result == SQLITE_ROW;
}

void Statement::run() {
    step();
    sqlite3_reset(m_statement);
}

std::int64_t Statement::number(int column) const {
    return sqlite3_column_int64(m_statement, column);
}

std::string Statement::text(int column) const {
    auto const* const bytes =
        reinterpret_cast<char const*>(sqlite3_column_text(m_statement, column));
    return bytes == nullptr ? std::string() : std::string(bytes);
}

bool Statement::isBlob(int column) const {
    return sqlite3_column_type(m_statement, column) == SQLITE_BLOB;
}

std::string Statement::blob(int column) const {
    auto const* const octets = static_cast<char const*>(sqlite3_column_blob(m_statement, column));
    auto const size = static_cast<std::size_t>(sqlite3_column_bytes(m_statement, column));
    return octets == nullptr ? std::string() : std::string(octets, size);
}

Transaction::Transaction(Database& database, Kind kind) : m_database(database) {
    database.execute(kind == Kind::Read ? "BEGIN" : "BEGIN EXCLUSIVE");
}

Transaction::~Transaction() {
    if (!m_done) sqlite3_exec(m_database.m_database.get(), "ROLLBACK", nullptr, nullptr, nullptr);
}

void Transaction::commit() {
    m_database.execute("COMMIT");
    m_done = true;
}

std::string nameForDamaged(std::string const& path) {
    std::time_t const now = std::time(nullptr);
    std::tm utc{};
    gmtime_r(&now, &utc);
    char text[32];
    std::strftime(text, sizeof text, "%Y%m%dT%H%M%SZ", &utc);
    return path + ".damaged-" + text;
}

} // namespace kvloamd
