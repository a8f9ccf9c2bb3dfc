// SPDX-License-Identifier: BSD-2-Clause
// Which rows are ours in tables that the host's own agent has too.
#pragma once

#include <chrono>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/objects/ServedTree.h"
#include "agent/rows/Clock.h"

namespace kvloamd {

/// Neighbouring cells of one column, named `column`, absolute, and a number from `first` to `last`.
struct RowRange {
    Oid column;
    std::uint32_t first = 0;
    std::uint32_t last = 0;

    bool operator==(RowRange const&) const = default;
};

/// Keeps what is entered with a master in step with the snapshots: cells that have a value are
/// entered, a few neighbours at once, and those of rows that have long been gone are taken out. A
/// table's rows have one number as their index.
///
/// One step at a time, from the last name to the first: a master that keeps its names in one list
/// finds the place of each at its beginning, and is done with thousands in a second; the other way
/// round it takes minutes. Used on one thread only.
class SharedRows {
  public:
    /// How long cells stay entered after their last value: a board may be back soon.
    static constexpr std::chrono::minutes kKeep{10};
    /// The cells of a range. A master takes no more at once than what it is through with in a
    /// moment.
    static constexpr std::uint32_t kLongest = 64;

    struct Step {
        bool enters; ///< or else is taken out
        RowRange range;

        bool operator==(Step const&) const = default;
    };

    /// All tables of the trees' places where the host has rows. The trees outlive the rows.
    explicit SharedRows(std::vector<ServedTree> const& trees);

    /// What there is now.
    void update(Facts const& facts, Clock::time_point now);
    /// What to do next; it counts as under way. Nothing while something is, or nothing is to do.
    std::optional<Step> next();
    /// The step under way has been done; or has been refused, for the reason `why`. What is refused
    /// is not tried again until the next start, and told once for each table.
    void done();
    void refused(std::string const& why);
    /// There is a new master, with whom nothing is entered.
    void restart();

  private:
    enum class State { Missing, Entering, Entered, Leaving, Refused };
    struct Range {
        std::uint32_t last;
        State state;
        bool gone;
        Clock::time_point used;
    };
    struct Column {
        Oid name;
        char const* place;
        TableColumn cells;
        std::map<std::uint32_t, Range> ranges; ///< by the first number
    };
    /// A column and the first number of its range.
    using Key = std::pair<std::size_t, std::uint32_t>;

    static void updateColumn(Column& column, Facts const& facts, Clock::time_point now);
    void listSteps();
    Range& underWay() { return m_columns[m_underWay->first].ranges.at(m_underWay->second); }

    std::vector<Column> m_columns; ///< ascending by name
    std::vector<Key> m_steps;      ///< to do, ascending
    std::optional<Key> m_underWay;
    std::vector<std::string> m_told; ///< the tables of which rows have been refused
};

} // namespace kvloamd
