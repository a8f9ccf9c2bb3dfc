// SPDX-License-Identifier: BSD-2-Clause
// An attribute store of the test's own, and the records in it.
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

#include <gtest/gtest.h>
#include <sqlite3.h>

#include "boardplatform/qsb.h"
#include "simulator/exports/Control.h"
#include "tests/support/TemporaryDirectory.h"

namespace sim {

/// A directory that VQRXCFGPATH names while this lives; the store is closed at both ends.
class Store {
  public:
    Store() {
        QSBCloseStorage();
        std::filesystem::create_directory(directory());
        setenv("VQRXCFGPATH", directory().c_str(), 1);
    }
    ~Store() {
        QSBCloseStorage();
        unsetenv("VQRXCFGPATH");
    }
    Store(Store const&) = delete;
    Store& operator=(Store const&) = delete;

    std::string directory() const { return m_around.file("cfg"); }
    std::string file() const { return directory() + "/attributes.db"; }

    /// Makes the store from the chassis, and leaves it closed.
    void make() const {
        char root[kQSBTypeNameSize];
        int instance = 0;
        EXPECT_EQ(QSBOpenStorage(root, &instance), QSB_SUCCESS);
        EXPECT_EQ(QSBCloseStorage(), QSB_SUCCESS);
    }

    /// Changes records behind the platform's back.
    void sql(std::string const& statements) const {
        sqlite3* database = nullptr;
        ASSERT_EQ(sqlite3_open(file().c_str(), &database), SQLITE_OK);
        EXPECT_EQ(sqlite3_exec(database, statements.c_str(), nullptr, nullptr, nullptr), SQLITE_OK)
            << sqlite3_errmsg(database);
        EXPECT_GT(sqlite3_changes(database), 0);
        sqlite3_close(database);
    }

  private:
    support::TemporaryDirectory m_around;
};

} // namespace sim
