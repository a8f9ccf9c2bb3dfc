// SPDX-License-Identifier: BSD-2-Clause
// A table that fits the screen.
#pragma once

#include <cstddef>
#include <ostream>
#include <string>
#include <vector>

#include "cli/Screen.h"

namespace kvloam {

/// A text in a table, and its colour.
struct Cell {
    std::string text;
    Paint paint = Paint::Plain;
};

enum class Align { Left, Right };

struct TableColumn {
    std::string title;
    /// The column with the highest number is the first to be cut and left out; 0 stays.
    int priority = 0;
    Align align = Align::Left;
    std::size_t least = 0; ///< columns of the screen to which it may be cut; 0: it is not cut
};

/// A `Table` prints rows under titles, each row as one line of the screen. Where there is not
/// enough room, it cuts and leaves out the columns that matter least. Unsynchronised.
class Table {
  public:
    explicit Table(std::vector<TableColumn> columns) : m_columns(std::move(columns)) {}

    /// Requires: as many cells as columns. Texts are cleaned when they are printed.
    void add(std::vector<Cell> row) { m_rows.push_back(std::move(row)); }
    bool isEmpty() const { return m_rows.empty(); }
    void print(std::ostream& out, Screen const& screen) const;

  private:
    std::vector<TableColumn> m_columns;
    std::vector<std::vector<Cell>> m_rows;
};

/// Prints a line of our own and others' words, which is cut to the screen.
void printWords(std::ostream& out, Screen const& screen, Cell const& line);

/// Prints names and what they stand for, one pair in a line.
void printPairs(std::ostream& out, Screen const& screen,
                std::vector<std::pair<std::string, Cell>> const& pairs);

} // namespace kvloam
