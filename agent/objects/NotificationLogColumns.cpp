// SPDX-License-Identifier: BSD-2-Clause
// The tables of NOTIFICATION-LOG-MIB.
#include "agent/objects/RowValues.h"
#include "agent/objects/SharedNames.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

using enum ValueType;

template <auto Rows>
auto const& logRows(Snapshot const& snapshot) {
    return (*snapshot.notifications).*Rows;
}

constexpr NamedNumber kAdminStates[] = {{1, "enabled"}, {2, "disabled"}};
constexpr NamedNumber kOperStates[] = {{1, "disabled"}, {2, "operational"}, {3, "noFilter"}};
constexpr NamedNumber kStorageTypes[] = {
    {1, "other"}, {2, "volatile"}, {3, "nonVolatile"}, {4, "permanent"}, {5, "readOnly"}};

constexpr Column<NotificationLogRow> kConfigColumns[] = {
    {"nlmConfigLogFilterName", 2, Octets, noText,
     about("The filter of what is not logged; empty: everything is logged")},
    {"nlmConfigLogEntryLimit", 3, Gauge, always<0>,
     about("How many notifications the log holds; 0: as many as all logs").as(Kind::Information)},
    {"nlmConfigLogAdminStatus", 4, Integer, always<1>,
     about("Whether notifications are to be logged").oneOf(kAdminStates)},
    {"nlmConfigLogOperStatus", 5, Integer, always<2>,
     about("Whether notifications are logged").oneOf(kOperStates)},
    {"nlmConfigLogStorageType", 6, Integer, always<5>,
     about("How the row is kept").oneOf(kStorageTypes).as(Kind::Information)},
    {"nlmConfigLogEntryStatus", 7, Integer, always<1>,
     about("Whether the row is in use").oneOf(kRowStates)},
};

constexpr Column<NotificationLogRow> kStatsColumns[] = {
    {"nlmStatsLogNotificationsLogged", 1, Counter, plain<&NotificationLogRow::logged>,
     about("Notifications that were entered since the agent's start").in("notifications")},
    {"nlmStatsLogNotificationsBumped", 2, Counter, plain<&NotificationLogRow::bumped>,
     about("Notifications that were removed to make room for others").in("notifications")},
};

constexpr Column<NotificationRow> kLogColumns[] = {
    {"nlmLogTime", 2, TimeStamp, plain<&NotificationRow::time>,
     about("When the notification was sent; 0: before the agent's start")},
    {"nlmLogDateAndTime", 3, Date, textIfKnown<&NotificationRow::date>,
     about("The date at which the notification was sent")},
    {"nlmLogContextName", 8, Octets, noText, about("The SNMP context of the notification")},
    {"nlmLogNotificationID", 9, ObjectId,
     [](NotificationRow const& row) -> Value { return NameView{row.name}; },
     about("The name of the notification").identifies()},
};

using Variable = NotificationVariableRow;

/// The value of a variable of this type; a variable of another type has none.
template <VariableType Type>
Value valueOf(Variable const& row) {
    if (row.logged.type != Type) return {};
    if (auto const* const number = std::get_if<std::int64_t>(&row.logged.value)) return *number;
    if (auto const* const octets = std::get_if<std::string>(&row.logged.value))
        return std::string_view(*octets);
    return NameView{std::get<Oid>(row.logged.value)};
}

// No notification has a variable of the types ipAddress and opaque.
constexpr Column<Variable> kVariableColumns[] = {
    {"nlmLogVariableID", 2, ObjectId,
     [](Variable const& row) -> Value { return NameView{row.logged.name}; },
     about("The name of the variable").identifies()},
    {"nlmLogVariableValueType", 3, Integer,
     [](Variable const& row) -> Value { return static_cast<std::int64_t>(row.logged.type); },
     about("The type of the variable, which says which column has its value")
         .oneOf(kVariableTypes)
         .as(Kind::Information)},
    {"nlmLogVariableCounter32Val", 4, Counter, valueOf<VariableType::Counter32>,
     about("The value of a variable of the type counter32")},
    {"nlmLogVariableUnsigned32Val", 5, Gauge, valueOf<VariableType::Unsigned32>,
     about("The value of a variable of the type unsigned32").as(Kind::Information)},
    {"nlmLogVariableTimeTicksVal", 6, TimeTicks, valueOf<VariableType::TimeTicks>,
     about("The value of a variable of the type timeTicks")},
    {"nlmLogVariableInteger32Val", 7, Integer, valueOf<VariableType::Integer32>,
     about("The value of a variable of the type integer32")},
    {"nlmLogVariableOctetStringVal", 8, Octets, valueOf<VariableType::OctetString>,
     about("The value of a variable of the type octetString")},
    {"nlmLogVariableOidVal", 10, ObjectId, valueOf<VariableType::ObjectId>,
     about("The value of a variable of the type objectId")},
    {"nlmLogVariableCounter64Val", 11, Counter64, valueOf<VariableType::Counter64>,
     about("The value of a variable of the type counter64")},
};

} // namespace

Table const& nlmConfigLogTable() {
    static RowTable<NotificationLogRow, logRows<&NotificationLogRows::logs>> const table(
        "nlmConfigLogTable", {92, 1, 1, 3, 1}, kConfigColumns);
    return table;
}

Table const& nlmStatsLogTable() {
    static RowTable<NotificationLogRow, logRows<&NotificationLogRows::logs>> const table(
        "nlmStatsLogTable", {92, 1, 2, 3, 1}, kStatsColumns);
    return table;
}

Table const& nlmLogTable() {
    static RowTable<NotificationRow, logRows<&NotificationLogRows::notifications>> const table(
        "nlmLogTable", {92, 1, 3, 1, 1}, kLogColumns);
    return table;
}

Table const& nlmLogVariableTable() {
    static RowTable<Variable, logRows<&NotificationLogRows::variables>> const table(
        "nlmLogVariableTable", {92, 1, 3, 2, 1}, kVariableColumns);
    return table;
}

} // namespace kvloamd
