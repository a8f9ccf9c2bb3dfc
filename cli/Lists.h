// SPDX-License-Identifier: BSD-2-Clause
// The agent's lists as tables.
#pragma once

#include <ostream>
#include <span>
#include <string>
#include <vector>

#include "cli/Answer.h"
#include "cli/Table.h"

namespace kvloam {

/// What a view is written to, and when its answer was made.
struct View {
    std::ostream& out;
    Screen const& screen;
    Date now;
};

/// A column of a list: its title, and its cell in a row.
struct ListColumn {
    TableColumn head;
    Cell (*cell)(Json const& row, Date now);
};

/// A `Section` is one list of an answer.
struct Section {
    char const* heading; ///< printed above it if the answer has several
    char const* key;     ///< of the list in the answer
    char const* none;    ///< printed when the list is empty: "no boards"
    std::span<ListColumn const> columns;
};

/// A `List` is a command that prints the lists of one answer.
struct List {
    char const* command; ///< the last part of the answer's path as well
    char const* help;
    std::vector<Section> sections;
};

/// Every list that has a command, in the order of the help.
std::vector<List> const& lists();
/// The list of this command. Requires: there is one.
List const& listNamed(std::string_view command);

void printList(View const& view, List const& list, Json const& answer);
/// Prints the rows as the section's table; its `none` when there are no rows.
void printRows(View const& view, Section const& section, Json const& rows);
/// The rows of an answer's alarms, the gravest first, of these the latest first.
Json sortedAlarms(Json const& rows);

} // namespace kvloam
