// SPDX-License-Identifier: BSD-2-Clause
// The performance history of a DS1 line, derived from its counters.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>
#include <memory>
#include <vector>

#include "LinePerformance.h"
#include "LineScheduler.h"
#include "LineSeconds.h"
#include "LineSource.h"
#include "LineState.h"
#include "board/DS1IntervalTable.h"
#include "board/DS1IntervalValidity.h"

/// A `Z7SimIntervalTable` gets its line's counters once a second and counts what the second was.
/// The `LineScheduler` ticks it, not the process's scheduler: either alone, and then it reads the
/// counters itself, or with the other lines of its board (`LineTicks`).
///
/// Seconds that were not seen (see `LineSeconds`) pass time and count nothing, and the intervals
/// that they belong to are not valid. The status is then the one that was known last.
class Z7SimIntervalTable final : public DS1IntervalTable, public DS1IntervalValidity {
  public:
    enum class Ticked : std::uint8_t { alone, withBoard };

    /// `past`: the counters of the seconds before, oldest first, which are counted as live ones
    /// are; may be empty. `source` and `state` are shared with the line's other users.
    Z7SimIntervalTable(LineFormat format, FailureTimes const& times,
                       std::shared_ptr<LineSource> source, std::shared_ptr<LineState> state,
                       std::vector<DS1LineCounters> const& past, Ticked ticked = Ticked::alone);
    ~Z7SimIntervalTable() override;

    /// A tick at which the line answered this.
    void tick(DS1LineCounters const& now);
    /// A tick at which the line is a second older, and otherwise as it was at the tick before.
    void tickUnchanged() {
        if (tickClean()) return;
        DS1LineCounters now = m_last;
        now.seconds = m_seconds.age() + 1;
        tick(now);
    }
    /// Prefetches what a tick uses.
    void fetch() const;

    /// A tick at which the table asks its line.
    int ScheduledAction() override;

    int GetControlledSlipSeconds(int n) override;
    int GetDegradedMinutes(int n) override;
    int CollectSecond() override;
    int CloseInterval() override;
    bool IsIntervalValid(int n) override;
    int GetIntervalsClosed() override { return m_closed; }

  private:
    /// Does `tickUnchanged` if the second is clean, as nearly every one is.
    bool tickClean() {
        if (m_timeElapsed >= kIntervalLength || (m_last.alarms & kFrameLosingAlarms) != 0)
            return false;
        return countClean(m_seconds.age() + 1);
    }
    /// Counts a second without errors or defects if it follows the one before. `age`: of the line.
    bool countClean(std::uint32_t age) {
        if (!m_seconds.isNext(age, LineScheduler::time()) || !m_performance.countClean())
            return false;
        m_seconds.goOn();
        m_timeElapsed += 1;
        return true;
    }
    void begin(std::vector<DS1LineCounters> const& past);
    void replay(std::vector<DS1LineCounters> const& past);
    void answered(DS1LineCounters const& now);
    void showStatus(std::uint32_t alarms);
    void count(DS1LineCounters const& now);
    void miss(std::int64_t seconds);
    void close();

    std::shared_ptr<LineSource> m_source;
    std::shared_ptr<LineState> m_state;
    std::uint64_t m_shown = 0; ///< the `lineStatusParts` of the status
    DS1LineCounters m_last{};  ///< as read last; `m_seconds` has their seconds
    LineSeconds m_seconds;
    LinePerformance m_performance;
    DS1Counter m_closed;               ///< intervals
    std::atomic<bool> m_missed{false}; ///< a second of the running interval
    /// The same of the closed ones, each at its interval's place in the ring.
    std::array<std::atomic<bool>, kIntervals> m_closedMissed{};
};
