// SPDX-License-Identifier: BSD-2-Clause
// The seconds of all lines of a board.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <vector>

#include "LineSource.h"
#include "platform/Schedulable.h"

class Z7SimIntervalTable;

/// A `LineTicks` ticks the interval tables of a board's lines together: once a second it asks for
/// the counters of all of them in one request, unless their generation shows that they are as they
/// were. A line that the answer lacks is asked alone. The `LineScheduler` ticks it.
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

    bool isNextSecondOf(DS1BoardGeneration const& now) const;
    void ask(bool together, std::uint64_t generation);

    std::unique_ptr<LineBatch> const m_batch;
    std::atomic<bool> m_isTogether{true};
    // Of the counters that the tables have read: the generation (0: unknown, or not the same for
    // all lines), and the seconds of the board's first line.
    std::uint64_t m_generation = 0;
    std::uint32_t m_seconds = 0;
    // Changed between passes only.
    std::vector<Line> m_lines;
};
