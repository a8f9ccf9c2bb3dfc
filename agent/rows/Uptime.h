// SPDX-License-Identifier: BSD-2-Clause
// Times as hundredths of a second since the agent's start.
#pragma once

#include <chrono>
#include <cstdint>

#include "agent/rows/Clock.h"

namespace kvloamd {

class Uptime {
  public:
    explicit Uptime(Clock::time_point started)
        : m_started(started),
          m_startDate(std::chrono::duration_cast<std::chrono::milliseconds>(
              std::chrono::system_clock::now().time_since_epoch() - (Clock::now() - started))) {}

    std::uint32_t now() const { return ticks(Clock::now() - m_started); }
    /// `seconds` since the epoch; 0 when that was before the agent's start.
    std::uint32_t of(long seconds) const {
        auto const since = std::chrono::seconds(seconds) - m_startDate;
        return since <= std::chrono::milliseconds::zero() ? 0 : ticks(since);
    }

  private:
    using Ticks = std::chrono::duration<std::int64_t, std::centi>;

    template <class Duration>
    static std::uint32_t ticks(Duration duration) {
        return static_cast<std::uint32_t>(std::chrono::duration_cast<Ticks>(duration).count());
    }

    Clock::time_point m_started;
    std::chrono::milliseconds m_startDate; ///< since the epoch
};

} // namespace kvloamd
