// SPDX-License-Identifier: BSD-2-Clause
// Which labels the rows of a snapshot have in metrics.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "agent/fronts/metrics/MetricFamilies.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// A `MetricRows` knows the labels of all rows of a snapshot, which it refers to. No two rows of a
/// table have the same labels, whatever boards call themselves. Immutable.
class MetricRows {
  public:
    /// `channels`: bearer channels have series.
    MetricRows(Snapshot const& snapshot, bool channels);

    /// The labels of each row of the group's table, as `MetricText::label` writes them; empty for a
    /// row that has no series.
    std::vector<std::string> labels(MetricGroup const& group, Facts const& facts) const;

    /// The label of a board; null if it is not there.
    std::string const* boardOf(std::uint32_t boardIndex) const;
    /// Gives labels that others have already one more, their place.
    static void distinguish(std::vector<std::string>& labels);

  private:
    std::string interfaceLabels(std::uint32_t ifIndex, MetricLabels kind) const;
    std::string rowLabels(MetricLabels kind, Snapshot const& snapshot, std::size_t row,
                          OidView index) const;

    Snapshot const& m_snapshot;
    bool m_channels;
    std::vector<std::string> m_boards; ///< the label of each board
};

} // namespace kvloamd
