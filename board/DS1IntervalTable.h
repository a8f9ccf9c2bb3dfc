// SPDX-License-Identifier: BSD-2-Clause
// The performance history of one DS1 line.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>

#include "core/Object.h"
#include "platform/Schedulable.h"

/// A `DS1Counter` is a counter that one thread changes while others read it. It behaves like the
/// number that it holds. A thread that reads a value also sees everything that was done before the
/// value was set.
class DS1Counter {
  public:
    DS1Counter(std::int32_t value = 0) : m_value(value) {}
    DS1Counter(DS1Counter const& other) : m_value(other) {}
    DS1Counter& operator=(DS1Counter const& other) {
        if (this != &other) *this = static_cast<std::int32_t>(other);
        return *this;
    }
    DS1Counter& operator=(std::int32_t value) {
        m_value.store(value, std::memory_order_release);
        return *this;
    }
    operator std::int32_t() const { return m_value.load(std::memory_order_acquire); }
    /// Requires that no other thread changes the counter.
    DS1Counter& operator+=(std::int32_t by) { return *this = *this + by; }

  private:
    std::atomic<std::int32_t> m_value;
};

/// A `DS1Interval` is one 15-minute interval, a row of DS1-MIB's dsx1IntervalTable (RFC 2495,
/// RFC 4805): its columns in their order.
struct DS1Interval {
    DS1Counter ErrorSeconds;
    DS1Counter SeverelyErrorSeconds;
    DS1Counter SeverelyErrorFramingSeconds;
    DS1Counter UnavailableSeconds;
    DS1Counter ControlledSlipSeconds;
    DS1Counter PathCodingViolations;
    DS1Counter LineErrorSeconds;
    DS1Counter BurstyErrorSeconds;
    DS1Counter DegradedMinutes;
    DS1Counter LineCodeViolations;
};

static_assert(sizeof(DS1Interval) == 40);

/// A `DS1IntervalTable` is the performance history of one line: the running interval and a ring of
/// the 96 intervals that were closed before it, 24 hours. The process's scheduler ticks it once a
/// second. The concrete table decides what a second counts.
///
/// Time: a tick is not a second of the line. The scheduler follows the system's clock: if that is
/// set back, no tick comes until it has caught up; if it is set forward, or the process was
/// suspended, the missed ticks follow at once. A concrete table therefore counts seconds by a
/// monotonic clock and by the seconds that its line itself counts, and treats a second without data
/// as missing, not as free of errors; `DS1IntervalValidity` shows which intervals missed data. A
/// module that needs one tick per second in spite of clock changes removes its tables from the
/// process's scheduler and ticks them by a monotonic clock (`docs/lines.md`).
///
/// Threads: the scheduler's thread ticks; any thread may read. A reader sees the old or the new
/// value of each counter; a row read while an interval is being closed may mix both.
///
/// Lifetime: the table is on the scheduler's list from the base's construction to the base's
/// destruction, but ticks reach it only while it has a handle. A constructor may therefore take its
/// time and needs no call of the scheduler. A tick may be under way when the last handle goes: the
/// destructor of a table whose ticks use members must begin with `Remove(this)` of the scheduler,
/// which waits for that tick. A table must be neither created nor destroyed in a scheduled action.
class KVLOAM_API DS1IntervalTable : public Object, public Schedulable {
  public:
    static constexpr int kIntervals = 96;
    /// The length of an interval in seconds.
    static constexpr int kIntervalLength = 900;

    /// Enters the table in the process's scheduler, with a period of one second.
    DS1IntervalTable();
    /// Removes the table from the scheduler.
    ~DS1IntervalTable() override;

    /// Seconds of the running interval, 0 to 899 (900 when it is about to be closed).
    virtual int GetTimeElapsed();
    /// The number of closed intervals, 0 to 96.
    /// Deliberate: once the ring is full, its oldest entry is cleared for the next interval, so 96
    /// intervals are valid although the last of them reads 0.
    virtual int GetValidIntervals();

    /// These read interval `n`: 0 is the running interval, 1 the one closed last, 96 the oldest. An
    /// interval that was never closed reads 0. `n` must be 0 to 96.
    virtual int GetErrorSeconds(int n);
    virtual int GetSeverelyErrorSeconds(int n);
    virtual int GetSeverelyErrorFramingSeconds(int n);
    virtual int GetUnavailableSeconds(int n);
    virtual int GetPathCodingViolations(int n);
    virtual int GetLineErrorSeconds(int n);
    virtual int GetBurstyErrorSeconds(int n);
    virtual int GetLineCodeViolations(int n);
    /// The concrete table implements these two from the same records.
    virtual int GetControlledSlipSeconds(int n) = 0;
    virtual int GetDegradedMinutes(int n) = 0;

    /// The tick: calls `CollectSecond`, or `CloseInterval` when the running interval is complete.
    /// Does nothing while the table has no handle, because it is not complete then. Returns 0.
    int ScheduledAction() override;
    /// Counts a second into the running interval and adds 1 to the time elapsed.
    virtual int CollectSecond() = 0;
    /// Passes the running interval to `ArchiveInterval` and begins a new one. The second of this
    /// call belongs to the new interval.
    virtual int CloseInterval() = 0;

  protected:
    /// The position in the ring of the `n`-th interval back.
    int GetTrueIndex(int n);
    /// Closes an interval: stores it in the ring and sets the time elapsed to 0. Returns 0.
    int ArchiveInterval(DS1Interval interval);
    /// The record that the readers read for `n`; null if there is none and they return 0.
    DS1Interval* interval(int n);

    DS1Counter m_timeElapsed;

  private:
    std::atomic<bool> m_wrapped{false};
    DS1Counter m_oldest;
    DS1Counter m_next;

  protected:
    DS1Interval m_current;

  private:
    int read(DS1Counter DS1Interval::*counter, int n);

    std::array<DS1Interval, kIntervals> m_ring;
};
