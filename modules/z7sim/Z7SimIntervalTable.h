// SPDX-License-Identifier: BSD-2-Clause
// The performance history of a line, derived from its counters.
#pragma once

#include <memory>
#include <vector>

#include "LinePerformance.h"
#include "LineSource.h"
#include "LineState.h"
#include "board/DS1IntervalTable.h"

/// Reads its line's counters once a second, on the scheduler's thread, and counts what the second
/// was. A second in which the platform does not answer counts as clean; what it held is found in
/// the next.
class Z7SimIntervalTable final : public DS1IntervalTable {
  public:
    /// `past`: the counters of the seconds before, oldest first, which are counted as live ones
    /// are; may be empty. `source` and `state` are shared with the line.
    Z7SimIntervalTable(LineFormat format, std::shared_ptr<LineSource> source,
                       std::shared_ptr<LineState> state, std::vector<DS1LineCounters> const& past);
    ~Z7SimIntervalTable() override;

    int GetControlledSlipSeconds(int n) override;
    int GetDegradedMinutes(int n) override;
    int CollectSecond() override;
    int CloseInterval() override;

  private:
    void replay(std::vector<DS1LineCounters> const& past);
    void count(DS1LineCounters const& now);
    void close();

    std::shared_ptr<LineSource> m_source;
    std::shared_ptr<LineState> m_state;
    DS1LineCounters m_last{}; ///< as read a second ago
    LinePerformance m_performance;
};
