// SPDX-License-Identifier: BSD-2-Clause
// A database file and its statements.
#include "simulator/store/Database.h"

#include <sqlite3.h>

namespace kvlsim {

namespace {

/// How long a request waits until another process unlocks the file.
constexpr int kPatience = 500; // milliseconds

[[noreturn]] void fail(sqlite3* handle) {
    if (handle == nullptr) throw DatabaseError("out of memory");
    if (sqlite3_extended_errcode(handle) == SQLITE_READONLY_ROLLBACK)
        throw UnfinishedChange(sqlite3_errmsg(handle));
    throw DatabaseError(sqlite3_errmsg(handle));
}

int flagsFor(DatabaseUse use) {
    switch (use) {
    case DatabaseUse::read:
        return SQLITE_OPEN_READONLY;
    case DatabaseUse::change:
        return SQLITE_OPEN_READWRITE;
    case DatabaseUse::create:
        return SQLITE_OPEN_READWRITE | SQLITE_OPEN_CREATE;
    }
    return SQLITE_OPEN_READONLY;
}

} // namespace

void Database::Close::operator()(sqlite3* handle) const {
    sqlite3_close(handle);
}

Database::Database(std::string const& path, DatabaseUse use) {
    sqlite3* handle = nullptr;
    int const result =
        sqlite3_open_v2(path.c_str(), &handle, flagsFor(use) | SQLITE_OPEN_FULLMUTEX, nullptr);
    m_handle.reset(handle);
    if (result != SQLITE_OK) fail(handle);
    sqlite3_busy_timeout(handle, kPatience);
}

void Database::execute(char const* sql) {
    if (sqlite3_exec(get(), sql, nullptr, nullptr, nullptr) != SQLITE_OK) fail(get());
}

std::string Database::head(std::size_t size) {
    // Through the database's own descriptor: to close another one of this process would drop the
    // locks that its connections hold on the file.
    sqlite3_file* file = nullptr;
    sqlite3_file_control(get(), "main", SQLITE_FCNTL_FILE_POINTER, static_cast<void*>(&file));
    if (file == nullptr || file->pMethods == nullptr) throw DatabaseError("the file is not open");
    std::string bytes(size, '\0');
    sqlite3_int64 length = 0;
    int result = file->pMethods->xFileSize(file, &length);
    if (result == SQLITE_OK && static_cast<std::uint64_t>(length) < size)
        bytes.resize(static_cast<std::size_t>(length));
    if (result == SQLITE_OK && !bytes.empty())
        result = file->pMethods->xRead(file, bytes.data(), static_cast<int>(bytes.size()), 0);
    if (result != SQLITE_OK) throw DatabaseError(sqlite3_errstr(result));
    return bytes;
}

void Statement::Finalize::operator()(sqlite3_stmt* statement) const {
    sqlite3_finalize(statement);
}

Statement::Statement(Database& database, char const* sql) {
    sqlite3_stmt* statement = nullptr;
    if (sqlite3_prepare_v3(database.get(), sql, -1, SQLITE_PREPARE_PERSISTENT, &statement,
                           nullptr) != SQLITE_OK)
        fail(database.get());
    m_statement.reset(statement);
}

void Statement::bind(int parameter, std::int64_t value) {
    sqlite3_bind_int64(m_statement.get(), parameter, value);
}

void Statement::bind(int parameter, std::string_view text) {
    sqlite3_bind_text(m_statement.get(), parameter, text.data(), static_cast<int>(text.size()),
                      SQLITE_STATIC);
}

void Statement::bindBytes(int parameter, std::string_view bytes) {
    // A null pointer would be bound as NULL, not as no bytes.
    sqlite3_bind_blob(m_statement.get(), parameter, bytes.empty() ? "" : bytes.data(),
                      static_cast<int>(bytes.size()), SQLITE_STATIC);
}

bool Statement::step() {
    int const result = sqlite3_step(m_statement.get());
    if (result != SQLITE_ROW && result != SQLITE_DONE) fail(sqlite3_db_handle(m_statement.get()));
    return result == SQLITE_ROW;
}

void Statement::reset() {
    sqlite3_reset(m_statement.get());
}

std::int64_t Statement::integer(int column) const {
    return sqlite3_column_int64(m_statement.get(), column);
}

std::string_view Statement::bytes(int column) const {
    void const* const bytes = sqlite3_column_blob(m_statement.get(), column);
    int const size = sqlite3_column_bytes(m_statement.get(), column);
    return bytes == nullptr
               ? std::string_view()
               : std::string_view(static_cast<char const*>(bytes), static_cast<std::size_t>(size));
}

} // namespace kvlsim
