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
        {"nlmConfigGlobalEntryLimit",
         {92, 1, 1, 1},
         ValueType::Gauge,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.notifications->limit};
         },
         about("How many notifications are kept in the log")
             .in("notifications")
             .as(Kind::Information)},
        {"nlmConfigGlobalAgeOut",
         {92, 1, 1, 2},
         ValueType::Gauge,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.notifications->age};
         },
         about("After how long a notification is removed from the log")
             .in("minutes")
             .as(Kind::Information)},
        {"nlmStatsGlobalNotificationsLogged",
         {92, 1, 2, 1},
         ValueType::Counter,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.notifications->logs.front().logged};
         },
         about("Notifications that were entered since the agent's start").in("notifications")},
        {"nlmStatsGlobalNotificationsBumped",
         {92, 1, 2, 2},
         ValueType::Counter,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.notifications->logs.front().bumped};
         },
         about("Notifications that were removed to make room for others").in("notifications")},
        {"alarmModelLastChanged",
         {118, 1, 1, 1},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.alarms->modelChange};
         },
         about("The value of sysUpTime when the kinds of alarms last changed")},
        {"alarmActiveLastChanged",
         {118, 1, 2, 1},
         ValueType::TimeStamp,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.alarms->lastChange};
         },
         about("The value of sysUpTime when an alarm was last raised or cleared")},
        {"alarmActiveOverflow",
         {118, 1, 2, 5},
         ValueType::Counter,
         [](Facts const& facts) -> Value { return std::int64_t{facts.snapshot.alarms->unlisted}; },
         about("How many alarms were not listed because the list was full").in("active alarms")},
        {"alarmClearMaximum",
         {118, 1, 3, 1},
         ValueType::Gauge,
         [](Facts const& facts) -> Value {
             return std::int64_t{facts.snapshot.alarms->clearedMaximum};
         },
         about("How many cleared alarms are kept at most").in("alarms")},
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
            &entStateTable(),
            &alarmModelTable(),
            &alarmActiveTable(),
            &alarmActiveVariableTable(),
            &alarmActiveStatsTable(),
            &alarmClearTable(),
            &nlmConfigLogTable(),
            &nlmStatsLogTable(),
            &nlmLogTable(),
            &nlmLogVariableTable()};
}

} // namespace kvloamd
