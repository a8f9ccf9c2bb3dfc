// SPDX-License-Identifier: BSD-2-Clause
// A database file and its statements, which are closed when they go out of scope.
#pragma once

#include <cstdint>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>

struct sqlite3;
struct sqlite3_stmt;

namespace kvlsim {

/// A `DatabaseError` is the database's own message about a failure, in one line.
class DatabaseError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// An `UnfinishedChange` is a change of a killed process that this connection must not undo.
class UnfinishedChange : public DatabaseError {
    using DatabaseError::DatabaseError;
};

enum class DatabaseUse : std::uint8_t { read, change, create };

/// A `Database` is one connection to a database file. Unsynchronised.
class Database {
  public:
    /// Throws DatabaseError.
    Database(std::string const& path, DatabaseUse use);

    /// Runs statements that answer nothing. Throws DatabaseError.
    void execute(char const* sql);
    /// The first bytes of the file, past any lock and cache; fewer when there are no more.
    std::string head(std::size_t size);
    sqlite3* get() const { return m_handle.get(); }

  private:
    struct Close {
        void operator()(sqlite3* handle) const;
    };
    std::unique_ptr<sqlite3, Close> m_handle;
};

/// A `Statement` is a prepared statement. It holds the file's lock from its first `step` until
/// `reset`, which `Execution` calls.
class Statement {
  public:
    Statement(Database& database, char const* sql);

    void bind(int parameter, std::int64_t value);
    /// Requires: a text that stays until `reset`.
    void bind(int parameter, std::string_view text);
    void bindBytes(int parameter, std::string_view bytes);

    /// Steps to the next row; false at the end. Throws DatabaseError.
    bool step();
    void reset();
    std::int64_t integer(int column) const;
    /// Valid until the next step. Empty unless the column holds bytes or a text.
    std::string_view bytes(int column) const;

  private:
    struct Finalize {
        void operator()(sqlite3_stmt* statement) const;
    };
    std::unique_ptr<sqlite3_stmt, Finalize> m_statement;
};

/// An `Execution` resets a statement at the end of a scope, also after an exception.
class Execution {
  public:
    explicit Execution(Statement& statement) : m_statement(statement) {}
    ~Execution() { m_statement.reset(); }
    Execution(Execution const&) = delete;
    Execution& operator=(Execution const&) = delete;

  private:
    Statement& m_statement;
};

} // namespace kvlsim
