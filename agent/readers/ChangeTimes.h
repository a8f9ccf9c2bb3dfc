// SPDX-License-Identifier: BSD-2-Clause
// When the status of lines has changed.
#pragma once

#include <cstdint>
#include <mutex>
#include <unordered_map>
#include <utility>

#include "agent/rows/Uptime.h"

namespace kvloamd {

/// A `ChangeTimes` remembers when it saw the status of each line change. Lines report dates, which
/// jump when the host's clock is set; so a date only shows that there was a change, and the steady
/// clock says when. Thread-safe.
class ChangeTimes {
  public:
    explicit ChangeTimes(Clock::time_point started, Clocks clocks = {})
        : m_uptime(started, std::move(clocks)) {}

    Uptime const& uptime() const { return m_uptime; }

    /// When the line entered its status, as `Uptime` says it. `date`: what the line reports,
    /// seconds since the epoch. `seen`: the present. A line that is new has changed at its date.
    std::uint32_t at(std::uint32_t ifIndex, long date, Clock::time_point seen);

  private:
    struct Change {
        long date = 0;
        std::uint32_t ticks = 0;
    };

    Uptime const m_uptime;
    std::mutex m_mutex;                                  ///< guards what follows
    std::unordered_map<std::uint32_t, Change> m_changes; ///< by ifIndex
};

} // namespace kvloamd
