// SPDX-License-Identifier: BSD-2-Clause
// Database files that a fuzzer's input damages.
#pragma once

#include <string>
#include <vector>

#include "tests/fuzz/FuzzInput.h"

namespace fuzz {

/// Makes the contents of an SQLite file. The input's first octet chooses how: any octets; `sound`,
/// a sound file, with octets replaced; or `sound` with rows of any types in `tables`, written past
/// all constraints that SQLite can be told to ignore.
std::string databaseFile(FuzzInput& input, std::string const& sound,
                         std::vector<std::string> const& tables);

/// The contents of a file, empty when there is none.
std::string contentsOf(std::string const& path);
void writeFile(std::string const& path, std::string const& contents);

} // namespace fuzz
