// SPDX-License-Identifier: BSD-2-Clause
// kvlAlarmTable, and the tables of ALARM-MIB.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"
#include "agent/objects/SharedNames.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

using enum ValueType;

template <auto Rows>
auto const& alarmRows(Snapshot const& snapshot) {
    return (*snapshot.alarms).*Rows;
}

template <auto Field, class Row>
Value name(Row const& row) {
    return NameView{row.*Field};
}

template <auto Field>
Value unlessZero(AlarmRow const& row) {
    return row.*Field == 0 ? Value{} : Value{std::int64_t{row.*Field}};
}

Oid const kZeroDotZero{0, 0};

template <class Row>
Value noName(Row const&) {
    return NameView{kZeroDotZero};
}

constexpr NamedNumber kSeverities[] = {{1, "cleared"}, {2, "indeterminate"}, {3, "critical"},
                                       {4, "major"},   {5, "minor"},         {6, "warning"}};

constexpr NamedNumber kStates[] = {{1, "active"}, {2, "ending"}};

constexpr Column<AlarmRow> kColumns[] = {
    {"kvlAlarmKind", 2, Text, text<&AlarmRow::kind>, about("The kind of the alarm").identifies()},
    {"kvlAlarmSeverity", 3, Integer, plain<&AlarmRow::severity>,
     about("How bad the alarm is").oneOf(kSeverities)},
    {"kvlAlarmResource", 4, Text, text<&AlarmRow::resource>,
     about("What has the alarm: board and interface in words").identifies()},
    {"kvlAlarmBoardIndex", 5, Integer, unlessZero<&AlarmRow::boardIndex>,
     about("The board index of the board that has the alarm")},
    {"kvlAlarmIfIndex", 6, Integer, unlessZero<&AlarmRow::ifIndex>,
     about("The ifIndex of the line, channel or interface that has the alarm")},
    {"kvlAlarmDate", 7, Date, textIfKnown<&AlarmRow::raised>, about("When the alarm was raised")},
    {"kvlAlarmBeganDate", 8, Date, textIfKnown<&AlarmRow::began>,
     about("When what is wrong began, the first of the times that kvlAlarmTimes counts")},
    {"kvlAlarmTimes", 9, Gauge, plain<&AlarmRow::times>,
     about("How many times it has begun since kvlAlarmBeganDate").in("times")},
    {"kvlAlarmText", 10, Text, text<&AlarmRow::text>,
     about("What the alarm means, and what was reported about it last")},
    {"kvlAlarmState", 11, Integer,
     [](AlarmRow const& row) -> Value { return static_cast<std::int64_t>(row.state); },
     about("Whether it is still wrong, or the alarm is about to be cleared").oneOf(kStates)},
};

constexpr NamedNumber kAddressTypes[] = {{0, "unknown"}, {1, "ipv4"},  {2, "ipv6"},
                                         {3, "ipv4z"},   {4, "ipv6z"}, {16, "dns"}};

// Of both tables that list alarms by date: the SNMP engine is the agent's own, which needs no
// identification.
constexpr Column<DatedAlarmRow> kActiveColumns[] = {
    {"alarmActiveEngineID", 4, Octets, noText,
     about("The SNMP engine that has the alarm; empty: the agent's own")},
    {"alarmActiveEngineAddressType", 5, Integer, always<0>,
     about("The type of alarmActiveEngineAddress").oneOf(kAddressTypes).as(Kind::Information)},
    {"alarmActiveEngineAddress", 6, Octets, noText,
     about("The address of the SNMP engine; empty: the agent's own")},
    {"alarmActiveContextName", 7, Octets, noText, about("The SNMP context of the alarm")},
    {"alarmActiveVariables", 8, Gauge, always<3>,
     about("How many rows alarmActiveVariableTable has for the alarm").as(Kind::Information)},
    {"alarmActiveNotificationID", 9, ObjectId, name<&DatedAlarmRow::notification>,
     about("The notification that announced the alarm; 0.0: none")},
    {"alarmActiveResourceId", 10, ObjectId, name<&DatedAlarmRow::resource>,
     about("An object of the board or interface that has the alarm; 0.0: none")},
    {"alarmActiveDescription", 11, Octets, text<&DatedAlarmRow::description>,
     about("The alarm in words").identifies()},
    {"alarmActiveLogPointer", 12, ObjectId, noName,
     about("The row of the notification log; 0.0: none")},
    {"alarmActiveModelPointer", 13, ObjectId, name<&DatedAlarmRow::model>,
     about("The row of alarmModelTable for this kind and severity")},
    {"alarmActiveSpecificPointer", 14, ObjectId, name<&DatedAlarmRow::specific>,
     about("The row of kvlAlarmTable")},
};

constexpr Column<DatedAlarmRow> kClearColumns[] = {
    {"alarmClearEngineID", 3, Octets, noText,
     about("The SNMP engine that had the alarm; empty: the agent's own")},
    {"alarmClearEngineAddressType", 4, Integer, always<0>,
     about("The type of alarmClearEngineAddress").oneOf(kAddressTypes).as(Kind::Information)},
    {"alarmClearEngineAddress", 5, Octets, noText,
     about("The address of the SNMP engine; empty: the agent's own")},
    {"alarmClearContextName", 6, Octets, noText, about("The SNMP context of the alarm")},
    {"alarmClearNotificationID", 7, ObjectId, name<&DatedAlarmRow::notification>,
     about("The notification that announced that the alarm was cleared; 0.0: none")},
    {"alarmClearResourceId", 8, ObjectId, name<&DatedAlarmRow::resource>,
     about("An object of the board or interface that had the alarm; 0.0: none")},
    {"alarmClearLogIndex", 9, Gauge, always<0>,
     about("The row of the notification log; 0: none").as(Kind::Information)},
    {"alarmClearModelPointer", 10, ObjectId, name<&DatedAlarmRow::model>,
     about("The row of alarmModelTable for this kind, cleared")},
};

using Variable = AlarmVariableRow;

// A variable has a value of its type only. There are no variables of the other types.
constexpr Column<Variable> kVariableColumns[] = {
    {"alarmActiveVariableID", 2, ObjectId, name<&Variable::name>,
     about("The name of the variable")},
    {"alarmActiveVariableValueType", 3, Integer,
     [](Variable const& row) -> Value { return static_cast<std::int64_t>(row.type); },
     about("The type of the variable, which says which column has its value")
         .oneOf(kVariableTypes)
         .as(Kind::Information)},
    {"alarmActiveVariableInteger32Val", 7, Integer,
     [](Variable const& row) {
         return row.type == VariableType::Integer32 ? plain<&Variable::integer>(row) : Value{};
     },
     about("The value of a variable of the type integer32")},
    {"alarmActiveVariableOctetStringVal", 8, Octets,
     [](Variable const& row) {
         return row.type == VariableType::OctetString ? text<&Variable::octets>(row) : Value{};
     },
     about("The value of a variable of the type octetString")},
};

constexpr Column<AlarmModelRow> kModelColumns[] = {
    {"alarmModelNotificationId", 3, ObjectId, name<&AlarmModelRow::notification>,
     about("The notification that announces this state of alarms of the kind; 0.0: none")},
    {"alarmModelVarbindIndex", 4, Gauge, always<0>,
     about("Which variable of the notification tells the state; 0: none").as(Kind::Information)},
    {"alarmModelVarbindValue", 5, Integer, always<0>,
     about("The value of that variable in this state")},
    {"alarmModelDescription", 6, Octets, text<&AlarmModelRow::description>,
     about("The kind of alarm and its state in words").identifies()},
    {"alarmModelSpecificPointer", 7, ObjectId, noName,
     about("A row with more about the state; 0.0: none")},
    {"alarmModelVarbindSubtree", 8, ObjectId, noName,
     about("The objects whose variables tell the resource; 0.0: any")},
    {"alarmModelResourcePrefix", 9, ObjectId, noName,
     about("The beginning of the names of resources; 0.0: any")},
    {"alarmModelRowStatus", 10, Integer, always<1>,
     about("Whether the row is in use").oneOf(kRowStates)},
};

constexpr Column<AlarmStatsRow> kStatsColumns[] = {
    {"alarmActiveStatsActiveCurrent", 1, Gauge, plain<&AlarmStatsRow::current>,
     about("The number of active alarms").in("alarms")},
    {"alarmActiveStatsActives", 2, Gauge, plain<&AlarmStatsRow::raised>,
     about("How many alarms have been raised since the agent's start")
         .in("alarms")
         .as(Kind::Counter)},
    {"alarmActiveStatsLastRaise", 3, TimeStamp, plain<&AlarmStatsRow::lastRaise>,
     about("When an alarm was last raised; 0: not yet")},
    {"alarmActiveStatsLastClear", 4, TimeStamp, plain<&AlarmStatsRow::lastClear>,
     about("When an alarm was last cleared; 0: not yet")},
};

} // namespace

Table const& alarmTable() {
    static RowTable<AlarmRow, alarmRows<&AlarmRows::alarms>> const table(
        "kvlAlarmTable", {1, 1, 12, 4, 1}, kColumns);
    return table;
}

Table const& alarmModelTable() {
    static RowTable<AlarmModelRow, alarmRows<&AlarmRows::models>> const table(
        "alarmModelTable", {118, 1, 1, 2, 1}, kModelColumns);
    return table;
}

Table const& alarmActiveTable() {
    static RowTable<DatedAlarmRow, alarmRows<&AlarmRows::active>> const table(
        "alarmActiveTable", {118, 1, 2, 2, 1}, kActiveColumns);
    return table;
}

Table const& alarmActiveVariableTable() {
    static RowTable<Variable, alarmRows<&AlarmRows::variables>> const table(
        "alarmActiveVariableTable", {118, 1, 2, 3, 1}, kVariableColumns);
    return table;
}

Table const& alarmActiveStatsTable() {
    static RowTable<AlarmStatsRow, alarmRows<&AlarmRows::stats>> const table(
        "alarmActiveStatsTable", {118, 1, 2, 4, 1}, kStatsColumns);
    return table;
}

Table const& alarmClearTable() {
    static RowTable<DatedAlarmRow, alarmRows<&AlarmRows::cleared>> const table(
        "alarmClearTable", {118, 1, 3, 2, 1}, kClearColumns);
    return table;
}

} // namespace kvloamd
