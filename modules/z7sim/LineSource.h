// SPDX-License-Identifier: BSD-2-Clause
// Where a line's counters come from.
#pragma once

#include <vector>

#include "LinePerformance.h"
#include "boardplatform/ds1_line.h"

class LineSource {
  public:
    virtual ~LineSource() = default;
    /// The counters as they are now. False, leaving `counters` alone, when there is no answer.
    virtual bool read(DS1LineCounters& counters) = 0;
};

/// The line of a device of the device mapper. Any thread.
class PlatformLine final : public LineSource {
  public:
    /// `device`: the device's handle.
    explicit PlatformLine(long device) : m_device(device) {}

    bool read(DS1LineCounters& counters) override;
    /// What the line counted before its platform started, a record a second, oldest first; empty
    /// when it has no past, or when that ended so long ago that the time since would be missing.
    std::vector<DS1LineCounters> past();

  private:
    long m_device;
};

/// The defects that are there at the moment of a reading.
LineDefects defectsOf(DS1LineCounters const& now);

/// What a line counted between two readings. Nothing when it has begun anew in between: its
/// counters started over.
LineSecond secondBetween(DS1LineCounters const& before, DS1LineCounters const& now);
