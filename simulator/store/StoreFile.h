// SPDX-License-Identifier: BSD-2-Clause
// The file of an attribute store: creating it and recognising it.
#pragma once

#include <cstdint>
#include <functional>
#include <string>
#include <string_view>

#include "simulator/store/Database.h"
#include "simulator/store/StoreContents.h"

namespace kvlsim {

inline constexpr char const* kStoreFileName = "attributes.db";
/// The root record's instance.
inline constexpr int kRootInstance = 1;

/// Creates the file, whole or not at all, if there is none; an existing file stays as it is.
/// Throws what `contents` throws, and DatabaseError.
void makeStoreFile(std::string const& path, std::function<StoreContents()> const& contents);

/// Undoes a change that a killed process left unfinished. Throws DatabaseError, which says what to
/// do, when this process may not write the file.
void undoUnfinishedChange(std::string const& path);

/// Throws DatabaseError, also for a file that is no attribute store; that file stays as it is.
/// Undoes an unfinished change first.
Database openStoreFile(std::string const& path, DatabaseUse use);

/// Adds a record and returns its instance.
std::int64_t addRecord(Database& database, RecordType const& type, std::int64_t parent,
                       std::string_view record);

} // namespace kvlsim
