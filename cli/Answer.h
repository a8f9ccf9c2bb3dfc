// SPDX-License-Identifier: BSD-2-Clause
// The agent's answers, which may be anything.
#pragma once

#include <cstdint>
#include <optional>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include <nlohmann/json.hpp>

#include "cli/Times.h"

namespace kvloam {

/// Keeps the keys of an object in the agent's order.
using Json = nlohmann::ordered_json;

/// A `CliError` says in one line what went wrong and what to do; the program ends with its status.
class CliError : public std::runtime_error {
  public:
    CliError(int status, std::string const& what) : std::runtime_error(what), m_status(status) {}
    int status() const { return m_status; }

  private:
    int m_status;
};

// Exit statuses.
inline constexpr int kSuccess = 0;
inline constexpr int kFailure = 1; ///< the agent refused, or its answer is none
inline constexpr int kUsage = 2;   ///< the command line is wrong
inline constexpr int kNoAgent = 3; ///< no agent could be reached

/// Reads an answer: an object that is nested at most `kDeepest` deep. Throws CliError.
Json readAnswer(std::string_view body);
inline constexpr int kDeepest = 32;

/// The text as it is printed with --json: indented unless `isCompact`. All characters are ASCII, so
/// that none can do anything to a terminal.
std::string jsonText(Json const& value, bool isCompact = false);

// What a row says under a key. A missing key, null, and a value of another type are all unknown.

/// Never throws; null when it is unknown, or `row` is no object.
Json const& field(Json const& row, char const* key);
Json const& field(Json&& row, char const* key) = delete; ///< it would not outlive the row
std::string textIn(Json const& row, char const* key);    ///< empty: unknown
std::optional<std::int64_t> numberIn(Json const& row, char const* key);
std::optional<double> realIn(Json const& row, char const* key);
std::optional<bool> truthIn(Json const& row, char const* key);
std::optional<Date> dateIn(Json const& row, char const* key);
std::vector<std::string> textsIn(Json const& row, char const* key);

/// The list of rows under `key`. Throws CliError when there is none, or when it has something else
/// than objects.
Json const& rowsIn(Json const& answer, char const* key);
Json const& rowsIn(Json&& answer, char const* key) = delete;

/// When the answer was made: its own time, or the present one.
Date timeOf(Json const& answer);

} // namespace kvloam
