// SPDX-License-Identifier: BSD-2-Clause
// The present status of a DS1 line.
#pragma once

#include <atomic>
#include <cstdint>

#include "LinePerformance.h"

/// A `LineState` holds the status of a line. The line's tick writes it; any thread may read it.
class LineState {
  public:
    /// `number` and `line`: under what changes are posted to the `LineStatusDelivery`.
    LineState(std::uint64_t number, int line) : m_number(number), m_line(line) {}

    /// Bits of `DS1LineStatusEnum`.
    int status() const { return m_status.load(std::memory_order_relaxed); }
    /// Seconds since the epoch; 0 until the status has changed.
    long lastChange() const { return m_lastChange.load(std::memory_order_relaxed); }

    /// Sets the status that a line is found with; this is no change.
    void begin(std::uint32_t alarms, LinePerformance const& performance);
    /// Sets the status that a second ended with, and posts it when it differs from the last one.
    void update(std::uint32_t alarms, LinePerformance const& performance);

  private:
    std::uint64_t m_number;
    int m_line;
    std::atomic<int> m_status{1};
    std::atomic<long> m_lastChange{0};
};

/// The status bits of a line with these alarms (`kDS1Alarm...`) and failures. Loss of signal, loss
/// of frame and AIS are shown as failures only, and so is that the line sends RAI because of them.
int lineStatusOf(std::uint32_t alarms, LinePerformance const& performance);
