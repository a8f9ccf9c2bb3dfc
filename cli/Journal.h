// SPDX-License-Identifier: BSD-2-Clause
// What has happened.
#pragma once

#include <cstdint>

#include "cli/Lists.h"

namespace kvloam {

/// Prints each entry of the journal as a line. Returns the highest number among `last` and the
/// entries'. Throws CliError when the answer has no list of entries.
std::int64_t printJournal(View const& view, Json const& answer, std::int64_t last);
/// The same as JSON, one entry in a line.
std::int64_t printJournalJson(std::ostream& out, Json const& answer, std::int64_t last);
/// The number of the newest entry; 0: there is none.
std::int64_t newestEntry(Json const& answer);

} // namespace kvloam
