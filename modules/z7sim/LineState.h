// SPDX-License-Identifier: BSD-2-Clause
// A line's present status.
#pragma once

#include <atomic>
#include <cstdint>

/// Written by the line's tick, read by anyone.
class LineState {
  public:
    /// `number` and `line`: under what changes are posted to the `LineStatusDelivery`.
    LineState(std::uint64_t number, int line) : m_number(number), m_line(line) {}

    /// Bits of `DS1LineStatusEnum`.
    int status() const { return m_status.load(std::memory_order_relaxed); }
    /// Seconds since the epoch; 0 until the status has changed.
    long lastChange() const { return m_lastChange.load(std::memory_order_relaxed); }

    /// What the line is found like, which is no change.
    void begin(std::uint32_t alarms, bool unavailable);
    /// Takes on what a second ended with, and posts it when that is a change.
    void update(std::uint32_t alarms, bool unavailable);

  private:
    std::uint64_t m_number;
    int m_line;
    std::atomic<int> m_status{1};
    std::atomic<long> m_lastChange{0};
};

/// The status bits of a line with these alarms (`kDS1Alarm...`).
int lineStatusOf(std::uint32_t alarms, bool unavailable);
