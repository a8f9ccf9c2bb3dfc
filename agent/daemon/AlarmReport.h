// SPDX-License-Identifier: BSD-2-Clause
// What becomes of alarms, and the time that they are held.
#pragma once

#include <atomic>
#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <utility>

#include "agent/alarms/AlarmList.h"
#include "agent/alarms/AlarmSources.h"
#include "agent/rows/Counters.h"

namespace kvloamd {

/// An `AlarmReport` logs every event of an alarm, and numbers it. Thread-safe.
class AlarmReport {
  public:
    std::uint32_t report(AlarmEvent event, Alarm const& alarm);

  private:
    std::atomic<std::uint32_t> m_last{0};
};

/// An `AlarmClock` makes the alarm list follow the time, and watches the agent's own health.
/// Thread-bound: the SNMP thread.
class AlarmClock {
  public:
    /// The time between two looks at the agent's health.
    static constexpr std::chrono::seconds kPause{2};

    /// `alarms` and `counters` outlive the clock. `changed` is called when the passing of time, or
    /// the agent's health, has changed the alarms.
    AlarmClock(AlarmList& alarms, Counters const& counters, std::function<void()> changed)
        : m_alarms(alarms), m_watch(counters), m_changed(std::move(changed)) {}

    /// Returns the time of the next call.
    Clock::time_point advance(Snapshot const& newest, Instant now);

  private:
    AlarmList& m_alarms;
    HealthWatch m_watch;
    std::function<void()> m_changed;
    std::optional<Clock::time_point> m_looked; ///< at the agent's health
};

} // namespace kvloamd
