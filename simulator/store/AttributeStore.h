// SPDX-License-Identifier: BSD-2-Clause
// The simulated attribute store: a database file below the directory that VQRXCFGPATH names.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "boardplatform/qsb.h"
#include "simulator/store/Database.h"
#include "simulator/store/StoreContents.h"
#include "simulator/store/StoreFile.h"

namespace kvlsim {

/// A `StoreError` says in one line, which names the file, why a store cannot be used or refuses a
/// change.
class StoreError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// A `ListedBoard` is a record as the store lists it.
struct ListedBoard {
    std::int64_t instance = 0;
    std::string family;
    BoardRecord record;
};

/// A `StoreListing` is everything in a store.
struct StoreListing {
    std::string path;
    std::vector<std::pair<std::int64_t, std::string>> families;
    std::vector<ListedBoard> boards; ///< family by family
};

/// An `AttributeStore` is a store with its two interfaces: the storage library's calls, and the
/// operator's changes. A change is one transaction, so that a reader in any process sees all of it
/// or nothing.
///
/// Thread-safe: one lock guards it all. Lock order: the store, the chassis.
class AttributeStore {
  public:
    /// `contents` returns the contents of a store that has to be created; it may throw, with the
    /// reason.
    explicit AttributeStore(std::function<StoreContents()> contents);
    ~AttributeStore();
    AttributeStore(AttributeStore const&) = delete;
    AttributeStore& operator=(AttributeStore const&) = delete;

    /// The directory of the store until `open` is called. Empty: none.
    void setDirectory(std::string directory);

    // The storage library. An open store stays in use until it is closed.
    QSBResult open(std::string_view& rootType, int& rootInstance);
    QSBResult first(std::string_view type, std::string_view parentType, int parent, int& instance);
    QSBResult next(int& instance);
    QSBResult value(std::string_view type, int instance, int offset, int length, void* buffer);
    QSBResult close();

    // The operator. All throw StoreError.
    StoreListing list();
    /// The family is added when it is not there. Refuses a serial number that is there.
    void add(StoreBoard const& board);
    void addFamily(std::string const& name);
    /// Refuses a serial number that is not there, as `remove` does.
    void set(std::string const& serial, FieldValues const& fields);
    void remove(std::string const& serial);
    /// Removes the family and all its boards.
    void removeFamily(std::string const& name);

  private:
    struct Reading;
    struct Walk {
        std::string type;
        int parent = 0;
        int last = 0;
    };

    std::string path() const;
    /// Creates the store if it does not exist, and opens it.
    Database openFile(DatabaseUse use);
    template <typename Change>
    void change(Change change);
    template <typename Call>
    QSBResult guarded(Call call) const;
    /// Runs `call`, and once more when a process was killed while it changed the file.
    template <typename Call>
    auto undoingUnfinished(Call call) const {
        try {
            return call();
        } catch (UnfinishedChange const&) {
            undoUnfinishedChange(path());
            return call();
        }
    }

    std::mutex m_mutex;
    std::function<StoreContents()> m_contents;
    std::string m_directory;
    std::unique_ptr<Reading> m_reading; ///< null: closed
    std::optional<Walk> m_walk;
};

} // namespace kvlsim
