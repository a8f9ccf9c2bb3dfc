// SPDX-License-Identifier: BSD-2-Clause
// Current alarms in an old snapshot.
#pragma once

#include <chrono>
#include <memory>
#include <utility>

#include "agent/alarms/AlarmSources.h"
#include "agent/alarms/AlarmTables.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// A `StaleSnapshot` shows alarms that are raised while the collector hangs, first of all the alarm
/// that says so: it copies the stale snapshot with the alarms of now, at most once in `kPause`,
/// because a copy of many boards takes a while. Thread-bound: the thread that answers from it.
class StaleSnapshot {
  public:
    static constexpr std::chrono::seconds kPause{1};

    /// `tables` outlives it.
    explicit StaleSnapshot(AlarmTables& tables) : m_tables(tables) {}

    /// `newest` itself, unless it is stale and lacks alarms of now.
    std::shared_ptr<Snapshot const> of(std::shared_ptr<Snapshot const> newest,
                                       Clock::time_point now) {
        if (now - newest->begun < HealthWatch::kStale) {
            m_copy.reset();
            return newest;
        }
        auto alarms = m_tables.rows();
        if (alarms == newest->alarms) return newest;
        bool const ofThis = m_copy && m_copy->number == newest->number;
        if (ofThis && (m_copy->alarms == alarms || now - m_made < kPause)) return m_copy;
        auto copy = std::make_shared<Snapshot>(*newest);
        copy->alarms = std::move(alarms);
        m_copy = std::move(copy);
        m_made = now;
        return m_copy;
    }

  private:
    AlarmTables& m_tables;
    std::shared_ptr<Snapshot const> m_copy; ///< null: none
    Clock::time_point m_made;               ///< good while there is a copy
};

} // namespace kvloamd
