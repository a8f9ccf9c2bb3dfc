// SPDX-License-Identifier: BSD-2-Clause
// The present status of a DS1 line.
#pragma once

#include <atomic>
#include <cstdint>
#include <mutex>

#include "LinePerformance.h"

/// A `LineState` is what a line has beside its history: its status, and whether changes of it are
/// to be announced. It belongs to the line for as long as its board is there, whether the board
/// runs or not. The line's tick writes the status.
///
/// Thread-safe.
class LineState {
  public:
    LineState();

    /// Under which changes are posted to the `LineStatusDelivery`.
    std::uint64_t number() const { return m_number; }
    /// Bits of `DS1LineStatusEnum`.
    int status() const { return m_status.load(std::memory_order_relaxed); }
    /// When the status changed last, in seconds since the epoch as the system's clock counts them
    /// now: when the clock has been set since, the date has been, too. 0 until a change.
    long lastChange() const;
    /// The same of the line's availability: the first second in which it was unavailable, or was
    /// available again. This is certain only some seconds later.
    long availabilityChange() const;
    int trapEnable() const { return m_trapEnable.load(std::memory_order_relaxed); }
    void setTrapEnable(int enable) { m_trapEnable.store(enable, std::memory_order_relaxed); }

    /// Sets the status that a line is found with; this is no change.
    void begin(std::uint32_t alarms, LinePerformance const& performance);
    /// Sets the status that a second ended with, and posts it when it differs from the last one.
    /// There is nothing to do while the `lineStatusParts` are the same.
    void update(std::uint32_t alarms, LinePerformance const& performance);

  private:
    /// A date of the system's clock; 0 until there is one.
    struct Date {
        long seconds = 0;
        long clocksApart = 0; ///< the system's clock minus the monotonic one, at that time

        static Date now();
        Date secondsBefore(long count) const { return {seconds - count, clocksApart}; }
        /// As the system's clock counts it now.
        long inUse() const;
    };

    std::uint64_t const m_number;
    bool m_unavailable = false; ///< for the tick
    std::atomic<int> m_status{1};
    std::atomic<int> m_trapEnable{2};
    mutable std::mutex m_mutex; ///< guards what follows
    Date m_changed;
    Date m_availabilityChanged;
};

/// All that the status of a line with these alarms depends on, in one number.
inline std::uint64_t lineStatusParts(std::uint32_t alarms, LinePerformance const& performance) {
    LineDefects const failures = performance.failures();
    std::uint64_t parts = alarms;
    for (bool const each : {performance.unavailable(), failures.lossOfSignal, failures.outOfFrame,
                            failures.alarmIndication})
        parts = parts << 1U | (each ? 1U : 0U);
    return parts;
}

/// The status bits of a line with these alarms (`kDS1Alarm...`) and failures. Loss of signal, loss
/// of frame and AIS are shown as failures only, and so is that the line sends RAI because of them.
int lineStatusOf(std::uint32_t alarms, LinePerformance const& performance);
