// SPDX-License-Identifier: BSD-2-Clause
// Times as hundredths of a second since the agent's start.
#pragma once

#include <chrono>
#include <cstdint>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// `time` in hundredths of a second. The count begins again from 0 after 497 days, as SNMP's
/// TimeTicks do.
inline std::uint32_t timeTicks(Clock::duration time) {
    using Hundredths = std::chrono::duration<std::int64_t, std::centi>;
    return static_cast<std::uint32_t>(std::chrono::duration_cast<Hundredths>(time).count());
}

/// An `Uptime` converts times to hundredths of a second since the agent's start. Immutable.
class Uptime {
  public:
    explicit Uptime(Clock::time_point started)
        : m_started(started),
          m_startDate(std::chrono::duration_cast<std::chrono::milliseconds>(
              std::chrono::system_clock::now().time_since_epoch() - (Clock::now() - started))) {}

    std::uint32_t now() const { return at(Clock::now()); }
    /// 0 for a time before the agent's start.
    std::uint32_t at(Clock::time_point when) const {
        return when <= m_started ? 0 : timeTicks(when - m_started);
    }
    /// `seconds` since the epoch; 0 for a time before the agent's start.
    std::uint32_t of(long seconds) const {
        auto const since = std::chrono::seconds(seconds) - m_startDate;
        return since <= std::chrono::milliseconds::zero() ? 0 : timeTicks(since);
    }

  private:
    Clock::time_point m_started;
    std::chrono::milliseconds m_startDate; ///< since the epoch
};

} // namespace kvloamd
