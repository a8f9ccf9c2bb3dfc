// SPDX-License-Identifier: BSD-2-Clause
// The objects of the standard MIB modules: lines, channels, interfaces and physical entities.
#pragma once

#include <array>
#include <span>
#include <vector>

#include "agent/Description.h"

namespace kvloamd {

/// The arc above them: their places are relative to it.
inline Oid const kStandardArc{1, 3, 6, 1, 2, 1};

/// The places that the agent takes over, relative, and no others below the arc.
inline std::array<Oid, 7> const kStandardPlaces{{
    {2},        // interfaces of IF-MIB
    {10, 7, 2}, // EtherLike-MIB
    {10, 18},   // DS1-MIB
    {10, 20},   // ISDN-MIB
    {31, 1},    // the rest of IF-MIB
    {47, 1},    // ENTITY-MIB
    {131, 1},   // ENTITY-STATE-MIB
}};

std::span<Scalar const> standardScalars();

Table const& ifTable();
Table const& ifXTable();
Table const& ifStackTable();
Table const& dsx1ConfigTable();
Table const& dsx1CurrentTable();
Table const& dsx1IntervalTable();
Table const& dsx1TotalTable();
Table const& isdnBearerTable();
Table const& isdnSignalingTable();
Table const& isdnLapdTable();
Table const& dot3StatsTable();
Table const& entPhysicalTable();
Table const& entAliasMappingTable();
Table const& entPhysicalContainsTable();
Table const& entStateTable();

/// Every table.
std::vector<Table const*> standardTables();

/// The rows of one kind among the interfaces.
template <auto Rows>
auto const& interfaceRows(Snapshot const& snapshot) {
    return snapshot.interfaces.*Rows;
}

} // namespace kvloamd
