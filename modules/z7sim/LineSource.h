// SPDX-License-Identifier: BSD-2-Clause
// Where a line's counters come from.
#pragma once

#include <atomic>
#include <vector>

#include "LinePerformance.h"
#include "boardplatform/ds1_line.h"

/// A `LineSource` answers a line's counters.
class LineSource {
  public:
    virtual ~LineSource() = default;
    /// The counters as they are now. False, leaving `counters` alone, when there is no answer.
    virtual bool read(DS1LineCounters& counters) = 0;
};

/// The line of a device of the device mapper. Thread-safe.
class PlatformLine final : public LineSource {
  public:
    /// `device`: the device's handle.
    explicit PlatformLine(long device) : m_device(device) {}

    bool read(DS1LineCounters& counters) override;
    /// While it is silent, `read` does not ask the platform and has no answer.
    void setSilent(bool silent) { m_silent = silent; }
    /// What the line counted before its platform started, a record a second, oldest first; empty
    /// when it has no past, or when that ended so long ago that the time since would be missing.
    std::vector<DS1LineCounters> past();

  private:
    long m_device;
    std::atomic<bool> m_silent{false};
};

/// The defects that are there at the moment of a reading.
LineDefects defectsOf(DS1LineCounters const& now);

/// What a line counted between two readings. Requires that it has not begun anew in between.
LineSecond secondBetween(DS1LineCounters const& before, DS1LineCounters const& now);
