// SPDX-License-Identifier: BSD-2-Clause
// One screen of health.
#pragma once

#include "cli/Lists.h"

namespace kvloam {

/// The answers from which the health of everything is told.
// NOLINTNEXTLINE(bugprone-exception-escape): to move JSON values throws nothing
struct Overview {
    Json health;
    Json boards;
    Json lines;
    Json alarms;
};

/// What is counted in an `Overview`.
struct Totals {
    std::int64_t boards = 0;
    std::int64_t failedBoards = 0;
    std::int64_t stoppedBoards = 0; ///< neither failed nor started
    std::int64_t lines = 0;
    std::int64_t failedLines = 0;
    std::int64_t alarms = 0;
    std::int64_t alarmsOf[6] = {}; ///< by gravity
    double age = 0;                ///< of the snapshot, in seconds
};

/// Throws CliError when the answers are none.
Totals count(Overview const& overview);

/// At most as many lines as the screen has: what is wrong is listed, the rest counted.
void printOverview(View const& view, Overview const& overview);

} // namespace kvloam
