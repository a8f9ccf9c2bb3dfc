// SPDX-License-Identifier: BSD-2-Clause
// Prints rows in columns that are as wide as their contents.
#pragma once

#include <ostream>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>

namespace kvlsim {

using TextRow = std::vector<std::string>;

/// Requires: rows of one length, and at least one.
void printColumns(std::vector<TextRow> const& rows, std::ostream& out);

/// The text of a cell: a string on one line, another value as JSON, "-" for null.
std::string cellText(nlohmann::json const& value);

} // namespace kvlsim
