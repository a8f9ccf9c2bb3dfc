// SPDX-License-Identifier: BSD-2-Clause
// What the commands do.
#pragma once

#include <string>
#include <vector>

#include "cli/Check.h"
#include "cli/Lists.h"
#include "cli/Session.h"

namespace kvloam {

// Each asks the agent and prints the answer, and returns the exit status. Throws CliError.

int showOverview(Session& session);
int showList(Session& session, List const& list);
int showBoard(Session& session, std::string const& board);
int showLine(Session& session, std::string const& line);
int showHealth(Session& session);
/// Without lines: of all lines.
int showHistory(Session& session, std::vector<std::string> const& lines);
/// The same in OpenMetrics text.
int exportHistory(Session& session, std::vector<std::string> const& lines);

struct JournalOptions {
    bool follow = false;
    std::int64_t after = -1; ///< entries with a higher number; -1: the newest entries
    std::int64_t limit = 50;
    double interval = 1; ///< seconds between two looks for new entries
};
/// With `follow`, it runs until the program is ended.
int showJournal(Session& session, JournalOptions const& options);

/// The exit status is that of a monitoring plugin, even when there is no answer.
int runCheck(Session& session, CheckLimits const& limits);

int showTables(Session& session);
int showTable(Session& session, std::string const& table);
int showScalars(Session& session);

/// Makes of the list of agents in `input` the file `output` for Prometheus; empty names are
/// standard input and output. Asks no agent.
int makeTargets(Session& session, std::string const& input, std::string const& output, int port);

/// Prints the names of things of a kind, for completion: "board", "line" or "table". It fails
/// without a word.
int printNames(Session& session, std::string const& kind);

} // namespace kvloam
