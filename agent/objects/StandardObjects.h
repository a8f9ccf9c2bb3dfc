// SPDX-License-Identifier: BSD-2-Clause
// The objects of the standard MIB modules: lines, channels, interfaces, physical entities, alarms.
#pragma once

#include <array>
#include <span>
#include <vector>

#include "agent/objects/ServedTree.h"

namespace kvloamd {

/// The arc above them: their places are relative to it.
inline Oid const kStandardArc{1, 3, 6, 1, 2, 1};

/// The places that the agent takes over, relative, and no others below the arc.
inline std::array<Place, 17> const kStandardPlaces{{
    {{2, 1}, "ifNumber", HostHas::All},
    {{2, 2}, "ifTable", HostHas::Rows},
    {{10, 7, 2}, "dot3StatsTable", HostHas::Rows},
    {{10, 7, 10}, "dot3PauseTable"},
    {{10, 7, 11}, "dot3HCStatsTable"},
    {{10, 18}, "DS1-MIB"},
    {{10, 20}, "ISDN-MIB"},
    {{10, 81}, "DS0-MIB"},
    {{31, 1, 1}, "ifXTable", HostHas::Rows},
    {{31, 1, 2}, "ifStackTable"},
    {{31, 1, 4}, "ifRcvAddressTable"},
    {{31, 1, 5}, "ifTableLastChange", HostHas::All},
    {{31, 1, 6}, "ifStackLastChange"},
    {{47, 1}, "ENTITY-MIB"},
    {{92, 1}, "NOTIFICATION-LOG-MIB", HostHas::All},
    {{118, 1}, "ALARM-MIB"},
    {{131, 1}, "ENTITY-STATE-MIB"},
}};

std::span<Scalar const> standardScalars();

Table const& ifTable();
Table const& ifXTable();
Table const& ifStackTable();
Table const& ifRcvAddressTable();
Table const& dsx1ConfigTable();
Table const& dsx1CurrentTable();
Table const& dsx1IntervalTable();
Table const& dsx1TotalTable();
Table const& dsx0ConfigTable();
Table const& dsx0ChanMappingTable();
Table const& isdnBearerTable();
Table const& isdnSignalingTable();
Table const& isdnSignalingStatsTable();
Table const& isdnLapdTable();
Table const& dot3StatsTable();
Table const& dot3PauseTable();
Table const& dot3HCStatsTable();
Table const& entPhysicalTable();
Table const& entAliasMappingTable();
Table const& entPhysicalContainsTable();
Table const& entStateTable();
Table const& alarmModelTable();
Table const& alarmActiveTable();
Table const& alarmActiveVariableTable();
Table const& alarmActiveStatsTable();
Table const& alarmClearTable();
Table const& nlmConfigLogTable();
Table const& nlmStatsLogTable();
Table const& nlmLogTable();
Table const& nlmLogVariableTable();

/// Every table.
std::vector<Table const*> standardTables();

/// The rows of one kind among the interfaces.
template <auto Table>
auto const& interfaceRows(Snapshot const& snapshot) {
    return snapshot.interfaces.*Table;
}

} // namespace kvloamd
