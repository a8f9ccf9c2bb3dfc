// SPDX-License-Identifier: BSD-2-Clause
// The performance history of one DS1 line.
#pragma once

#include <array>
#include <atomic>
#include <cstdint>

#include "core/Object.h"
#include "platform/Schedulable.h"

/// A counter that one thread changes while others read it. Behaves like the number it holds. Who
/// reads a value also sees what was done before it was set.
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

/// One 15-minute interval, a row of DS1-MIB's dsx1IntervalTable (RFC 2495, RFC 4805): its columns
/// in their order.
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
/// Threads: the scheduler's thread ticks; any thread may read. A reader sees the old or the new
/// value of each counter; a row read while an interval is closed may mix both.
///
/// Lifetime: the table is on the scheduler's list from the base's construction to the base's
/// destruction, but ticks reach it only while it has a handle. A constructor may take its time and
/// ends with `ChangePeriod(this, 1)` of the scheduler, which orders its writes before later ticks.
/// The destructor of a table whose ticks use members begins with `Remove(this)`, which waits for a
/// tick under way. A table must be neither made nor destroyed in a scheduled action.
///
/// A tick is a second of the system's clock, which may be set: none comes while the clock catches
/// up with itself, and many come at once after a step forward. A table that must not be wrong then
/// takes itself off the process's scheduler, is ticked by a monotonic clock, and tells by
/// `DS1IntervalValidity` which intervals missed data.
class KVLOAM_API DS1IntervalTable : public Object, public Schedulable {
  public:
    static constexpr int kIntervals = 96;
    /// The length of an interval in seconds.
    static constexpr int kIntervalLength = 900;

    /// Enters the table with the process's scheduler, with a period of one second.
    DS1IntervalTable();
    /// Takes the table off the scheduler's list.
    ~DS1IntervalTable() override;

    /// Seconds of the running interval, 0 to 899 (900 when it is about to be closed).
    virtual int GetTimeElapsed();
    /// The number of closed intervals, 0 to 96.
    /// Deliberate: once the ring is full its oldest entry is cleared for the interval to come, so
    /// 96 intervals are valid although the last of them reads 0.
    virtual int GetValidIntervals();

    /// These read interval `n`: 0 is the running one, 1 the one closed last, 96 the oldest. An
    /// interval that was never closed reads 0. Callers keep `n` within 0 to 96.
    virtual int GetErrorSeconds(int n);
    virtual int GetSeverelyErrorSeconds(int n);
    virtual int GetSeverelyErrorFramingSeconds(int n);
    virtual int GetUnavailableSeconds(int n);
    virtual int GetPathCodingViolations(int n);
    virtual int GetLineErrorSeconds(int n);
    virtual int GetBurstyErrorSeconds(int n);
    virtual int GetLineCodeViolations(int n);
    /// The concrete table answers these two from the same records.
    virtual int GetControlledSlipSeconds(int n) = 0;
    virtual int GetDegradedMinutes(int n) = 0;

    /// The tick: calls `CollectSecond`, or `CloseInterval` when the running interval is complete.
    /// Does nothing while the table has no handle, because it is not complete then. Returns 0.
    int ScheduledAction() override;
    /// Counts a second into the running interval and adds 1 to the time elapsed.
    virtual int CollectSecond() = 0;
    /// Hands the running interval to `ArchiveInterval` and begins a new one. The second of this
    /// call belongs to the new interval.
    virtual int CloseInterval() = 0;

  protected:
    /// The place in the ring of the `n`-th interval back.
    int GetTrueIndex(int n);
    /// Closes an interval: stores it in the ring and sets the time elapsed to 0. Returns 0.
    int ArchiveInterval(DS1Interval interval);
    /// The record that the readers read for `n`; null where they have none and answer 0.
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
