// SPDX-License-Identifier: BSD-2-Clause
// One thing in detail.
#pragma once

#include "cli/Answer.h"
#include "cli/Lists.h"

namespace kvloam {

/// A board with its lines, devices and processors. Throws CliError when the answer has no board.
void printBoard(View const& view, Json const& answer);
/// A line with its counters of the running interval and of the last 24 hours. Throws CliError.
void printLine(View const& view, Json const& answer);
/// Every scalar value of `object`, in the agent's order.
void printFields(View const& view, Json const& object);
/// A table of the agent by its names in the MIB module. Throws CliError.
void printTable(View const& view, Json const& answer);

/// The object under `key`. Throws CliError when there is none.
Json const& objectIn(Json const& answer, char const* key);
Json const& objectIn(Json&& answer, char const* key) = delete;

} // namespace kvloam
