// SPDX-License-Identifier: BSD-2-Clause
// Turns alarms into the rows that the agent serves.
#pragma once

#include <map>
#include <memory>
#include <mutex>

#include "agent/alarms/AlarmList.h"
#include "agent/rows/AlarmRows.h"
#include "agent/rows/Oid.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

/// An `AlarmTables` makes the rows of an alarm list, again only when the list has changed.
/// Thread-safe.
class AlarmTables {
  public:
    /// `alarms` outlives the tables. `enterprise`: the arc above KVL-OAM-MIB. `started`: the
    /// agent's start.
    AlarmTables(AlarmList const& alarms, Oid enterprise, Clock::time_point started);

    std::shared_ptr<AlarmRows const> rows();

  private:
    void addActive(AlarmRows& rows, Alarm const& alarm, bool present) const;
    void addVariables(AlarmRows& rows, AlarmRow const& row) const;
    void addModels(AlarmRows& rows, AlarmPolicies const& policies) const;
    static void addTotals(AlarmRows& rows, std::map<AlarmKind, AlarmList::KindCounts> const& kinds);
    DatedAlarmRow datedRow(Alarm const& alarm) const;
    Oid notificationOf(AlarmKind kind) const;
    Oid resourceOf(Condition const& condition) const;
    Oid own(Oid const& relative) const;

    AlarmList const& m_alarms;
    Oid const m_enterprise;
    Uptime const m_uptime;
    std::mutex m_mutex; ///< guards what follows
    std::uint64_t m_version = 0;
    std::shared_ptr<AlarmRows const> m_rows; ///< null: not made yet
};

/// The state by which ALARM-MIB's model orders a severity: 1 for a cleared alarm to 6 for critical.
std::uint32_t modelState(AlarmSeverity severity);

} // namespace kvloamd
