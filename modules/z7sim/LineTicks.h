// SPDX-License-Identifier: BSD-2-Clause
// The seconds of all lines of a board.
#pragma once

#include <atomic>
#include <memory>
#include <vector>

#include "LineSource.h"
#include "platform/Schedulable.h"

class Z7SimIntervalTable;

/// A `LineTicks` ticks the interval tables of a board's lines together: once a second it asks for
/// the counters of all of them in one request. A line that the answer lacks is asked alone. The
/// `LineScheduler` ticks it.
///
/// Thread-safe, apart from `ScheduledAction`. No scheduled action may call it.
class LineTicks final : public Schedulable {
  public:
    explicit LineTicks(std::unique_ptr<LineBatch> batch);
    ~LineTicks();
    LineTicks(LineTicks const&) = delete;
    LineTicks& operator=(LineTicks const&) = delete;

    /// Ticks a table from now on, which nobody else ticks, until it is removed. `device`: the
    /// handle of its line.
    void add(long device, Z7SimIntervalTable& table);
    /// Waits for a tick under way.
    void remove(Z7SimIntervalTable const& table);
    /// Whether the lines are asked together, as they are at first, or each of them alone.
    void askTogether(bool together) { m_isTogether = together; }

    /// Thread-bound: the scheduler's thread.
    int ScheduledAction() override;

  private:
    struct Line {
        long device;
        Z7SimIntervalTable* table;
    };

    std::unique_ptr<LineBatch> const m_batch;
    std::atomic<bool> m_isTogether{true};
    // Changed between passes only.
    std::vector<Line> m_lines;
    std::vector<DS1BoardLine> m_answers; ///< to the last request, with room for all lines
};
