// SPDX-License-Identifier: BSD-2-Clause
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

std::span<Scalar const> standardScalars() {
    static Scalar const described[] = {
        {"ifNumber",
         {2, 1},
         ValueType::Integer,
         [](Facts const& facts) -> Value {
             return static_cast<std::int64_t>(facts.snapshot.interfaces.interfaces.size());
         },
         about("The number of interfaces").in("interfaces").as(Kind::Gauge)},
        {"ifTableLastChange",
         {31, 1, 5},
         ValueType::BeginStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.interfaces.lastChange};
         },
         about("The value of sysUpTime when a row of ifTable was last added or removed")},
        {"ifStackLastChange",
         {31, 1, 6},
         ValueType::BeginStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.interfaces.stackLastChange};
         },
         about("The value of sysUpTime when the stack last changed")},
        // Rows cannot be created, so there is no index for the next one.
        {"isdnSignalingGetIndex",
         {10, 20, 1, 3, 1},
         ValueType::Integer,
         [](Facts const& /*facts*/) -> Value { return std::int64_t{0}; },
         about("The index for a new signalling channel; 0: none can be created")},
        {"entLastChangeTime",
         {47, 1, 4, 1},
         ValueType::BeginStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.entities.lastChange};
         },
         about("The value of sysUpTime when an entity last changed")},
    };
    return described;
}

std::vector<Table const*> standardTables() {
    return {&ifTable(),
            &ifXTable(),
            &ifStackTable(),
            &ifRcvAddressTable(),
            &dsx1ConfigTable(),
            &dsx1CurrentTable(),
            &dsx1IntervalTable(),
            &dsx1TotalTable(),
            &isdnBearerTable(),
            &isdnSignalingTable(),
            &isdnSignalingStatsTable(),
            &isdnLapdTable(),
            &dsx0ConfigTable(),
            &dsx0ChanMappingTable(),
            &dot3StatsTable(),
            &dot3PauseTable(),
            &dot3HCStatsTable(),
            &entPhysicalTable(),
            &entAliasMappingTable(),
            &entPhysicalContainsTable(),
            &entStateTable()};
}

} // namespace kvloamd
