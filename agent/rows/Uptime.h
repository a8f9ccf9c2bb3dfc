// SPDX-License-Identifier: BSD-2-Clause
// Times as hundredths of a second since the agent's start.
#pragma once

#include <cstdint>

#include <algorithm>
#include <chrono>
#include <utility>

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
    explicit Uptime(Clock::time_point started, Clocks clocks = {})
        : m_started(started), m_clocks(std::move(clocks)), m_startDate(startDate()) {}

    std::uint32_t now() const { return at(m_clocks.now()); }
    /// 0 for a time before the agent's start.
    std::uint32_t at(Clock::time_point when) const {
        return when <= m_started ? 0 : timeTicks(when - m_started);
    }
    /// `seconds` since the epoch, as the system's clock counts them now; 0 for a time before the
    /// agent's start. Never later than now.
    std::uint32_t of(long seconds) const {
        std::chrono::seconds const date(std::clamp<std::int64_t>(seconds, 0, kLastDate));
        Clock::duration const since = date - (m_startDate + clockSteps());
        Clock::duration const uptime = m_clocks.now() - m_started;
        return since <= Clock::duration::zero() ? 0 : timeTicks(std::min(since, uptime));
    }

  private:
    /// Far ahead, and still a date of the system's clock.
    static constexpr std::int64_t kLastDate = std::int64_t{1} << 33;

    /// By how much the system's clock has been set since the agent's start, in whole seconds.
    std::chrono::seconds clockSteps() const {
        return std::chrono::round<std::chrono::seconds>(startDate() - m_startDate);
    }
    /// The agent's start, since the epoch, as the system's clock counts now.
    std::chrono::milliseconds startDate() const {
        return m_clocks.date() -
               std::chrono::duration_cast<std::chrono::milliseconds>(m_clocks.now() - m_started);
    }

    Clock::time_point m_started;
    Clocks m_clocks;
    std::chrono::milliseconds m_startDate; ///< since the epoch
};

} // namespace kvloamd
