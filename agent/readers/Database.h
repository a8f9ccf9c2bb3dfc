// SPDX-License-Identifier: BSD-2-Clause
// SQLite with exceptions.
#pragma once

#include <chrono>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>

struct sqlite3;
struct sqlite3_stmt;

namespace kvloamd {

/// The database cannot be read or written now. Its text has one line.
class DatabaseFault : public std::runtime_error {
  public:
    explicit DatabaseFault(std::string why);
};

/// Another process has locked the database.
class DatabaseInUse : public DatabaseFault {
  public:
    using DatabaseFault::DatabaseFault;
};

/// The file is not a database, or its contents contradict each other.
class DatabaseDamaged : public DatabaseFault {
  public:
    using DatabaseFault::DatabaseFault;
};

/// A `Database` is an open SQLite file. All operations throw `DatabaseFault`. Unsynchronised.
class Database {
  public:
    /// Opens the file, and creates it if it is missing.
    explicit Database(std::string const& path);

    /// How long an operation waits for another process to unlock the file.
    void setPatience(std::chrono::milliseconds patience);
    /// Whether the file can only be read.
    bool isReadOnly() const;
    void execute(char const* sql);
    /// The first column of the first row; 0 if there is no row.
    std::int64_t number(char const* sql);

  private:
    friend class Statement;
    friend class Transaction;
    struct Close {
        void operator()(sqlite3* database) const;
    };

    [[noreturn]] void fail() const;

    std::unique_ptr<sqlite3, Close> m_database;
};

/// A `Statement` is a prepared statement. The database outlives it.
class Statement {
  public:
    Statement(Database& database, char const* sql);
    ~Statement();
    Statement(Statement const&) = delete;
    Statement& operator=(Statement const&) = delete;

    /// `value` must live until the next `run`.
    Statement& bind(int parameter, std::string const& value);
    Statement& bind(int parameter, std::int64_t value);
    /// As octets, which SQLite never converts. `value` must live until the next `run`.
    Statement& bindBlob(int parameter, std::string const& value);
    /// Steps to the next row. Returns false after the last one.
    bool step();
    /// Executes the statement and makes it ready for other values.
    void run();
    std::int64_t number(int column) const;
    std::string text(int column) const;
    bool isBlob(int column) const;
    std::string blob(int column) const;

  private:
    Database& m_database;
    sqlite3_stmt* m_statement = nullptr;
};

/// A `Transaction` is rolled back at the end of its scope unless it was committed.
class Transaction {
  public:
    enum class Kind { Read, Write };

    Transaction(Database& database, Kind kind);
    ~Transaction();
    Transaction(Transaction const&) = delete;
    Transaction& operator=(Transaction const&) = delete;

    void commit();

  private:
    Database& m_database;
    bool m_done = false;
};

/// What a damaged file at `path` is renamed to: `<path>.damaged-<date>`, with the present time in
/// UTC.
std::string nameForDamaged(std::string const& path);

} // namespace kvloamd
