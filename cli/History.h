// SPDX-License-Identifier: BSD-2-Clause
// The last 24 hours of a line: as plots, and as samples for a time series database.
#pragma once

#include <array>
#include <optional>
#include <string>
#include <vector>

#include "cli/Lists.h"

namespace kvloam {

/// A closed interval of 15 minutes.
struct HistoryInterval {
    Date begin;
    Json counts; ///< an object with the counters; what is not known is missing or null
};

/// A `LineHistory` is what an answer says about a line's closed intervals.
struct LineHistory {
    static constexpr std::size_t kIntervals = 96;
    static constexpr Seconds kLength{900};

    std::string name;
    std::string board;
    /// By their place: the oldest of 24 hours first. Nothing: the line has no data of the interval.
    std::array<std::optional<HistoryInterval>, kIntervals> intervals;
    Date end; ///< of the latest closed interval

    bool isEmpty() const;
};

/// Throws CliError when the answer has no line, or no list of intervals.
LineHistory readHistory(Json const& answer);

/// Plots errored, severely errored and unavailable seconds. A gap in the base line is an interval
/// without data.
void printHistory(View const& view, LineHistory const& history);

/// All counters in OpenMetrics text, each sample with the time at which its interval ended.
/// `promtool tsdb create-blocks-from openmetrics` reads it.
std::string openMetrics(std::vector<LineHistory> const& histories);

} // namespace kvloam
