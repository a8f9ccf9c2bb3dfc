// SPDX-License-Identifier: BSD-2-Clause
// The rows to register in tables that the host's own agent serves, too.
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

/// Neighbouring cells of one column: the absolute name `column`, then a number from `first` to
/// `last`.
struct RowRange {
    Oid column;
    std::uint32_t first = 0;
    std::uint32_t last = 0;

    bool operator==(RowRange const&) const = default;
};

/// `SharedRows` keeps the cells that are registered with a master in step with the snapshots. It
/// registers cells that have a value, in ranges of neighbours, and unregisters the cells of rows
/// that have been gone for long. Rows have one number as their index.
///
/// It proceeds one step at a time, from the last name to the first. A master that keeps its names
/// in one ascending list then inserts each at the beginning, thousands in a second; in ascending
/// order it would take minutes. Unsynchronised.
class SharedRows {
  public:
    /// How long cells stay registered after their last value, because a board may return soon.
    static constexpr std::chrono::minutes kKeep{10};
    /// The most cells of a range; the master takes in a range in one piece, without answering
    /// requests meanwhile.
    static constexpr std::uint32_t kLongest = 64;

    struct Step {
        bool enters; ///< registers the range; else unregisters it
        RowRange range;

        bool operator==(Step const&) const = default;
    };

    /// Keeps the tables at all places where the host has rows. `trees` outlive the rows.
    explicit SharedRows(std::vector<ServedTree> const& trees);

    /// Compares the rows with a snapshot.
    void update(Facts const& facts, Clock::time_point now);
    /// Returns the next step, which is then under way; nothing while another one is, or when there
    /// is none.
    std::optional<Step> next();
    /// Ends the step under way, as done or as refused for the reason `why`. A refused range is not
    /// tried again until the agent's next start. Only a table's first refusal is logged.
    void done();
    void refused(std::string const& why);
    /// Starts again with a new master, which knows no rows.
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
        std::map<std::uint32_t, Range> ranges; ///< by their first number
    };
    /// A column and the first number of its range.
    using Key = std::pair<std::size_t, std::uint32_t>;

    static void updateColumn(Column& column, Facts const& facts, Clock::time_point now);
    void listSteps();
    Range& underWay() { return m_columns[m_underWay->first].ranges.at(m_underWay->second); }

    std::vector<Column> m_columns; ///< ascending by name
    std::vector<Key> m_steps;      ///< outstanding, ascending
    std::optional<Key> m_underWay;
    std::vector<std::string> m_told; ///< the tables whose refusal has been logged
};

} // namespace kvloamd
