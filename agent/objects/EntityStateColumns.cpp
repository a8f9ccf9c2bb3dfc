// SPDX-License-Identifier: BSD-2-Clause
// ENTITY-STATE-MIB's table.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

using Row = EntityStateRow;

auto const& stateRows(Snapshot const& snapshot) {
    return snapshot.entities.states;
}

template <auto State>
Value state(Row const& row) {
    return std::int64_t{static_cast<int>(row.state.*State)};
}

Value alarm(Row const& row) {
    return std::string_view(&row.state.alarm, 1);
}

using enum ValueType;

constexpr NamedNumber kEntStateAdmin[] = {
    {1, "unknown"}, {2, "locked"}, {3, "shuttingDown"}, {4, "unlocked"}};

constexpr NamedNumber kEntStateOper[] = {
    {1, "unknown"}, {2, "disabled"}, {3, "enabled"}, {4, "testing"}};

constexpr NamedNumber kEntStateUsage[] = {{1, "unknown"}, {2, "idle"}, {3, "active"}, {4, "busy"}};

constexpr NamedNumber kEntStateAlarm[] = {{0, "unknown"},      {1, "underRepair"}, {2, "critical"},
                                          {3, "major"},        {4, "minor"},       {5, "warning"},
                                          {6, "indeterminate"}};

constexpr NamedNumber kEntStateStandby[] = {
    {1, "unknown"}, {2, "hotStandby"}, {3, "coldStandby"}, {4, "providingService"}};

constexpr Column<Row> kColumns[] = {
    {"entStateLastChanged", 1, Date, textIfKnown<&Row::changed>,
     about("When one of the states last changed")},
    {"entStateAdmin", 2, Integer, state<&EntityState::admin>,
     about("Whether the operator permits the entity to work").oneOf(kEntStateAdmin)},
    {"entStateOper", 3, Integer, state<&EntityState::oper>,
     about("Whether the entity works").oneOf(kEntStateOper)},
    {"entStateUsage", 4, Integer, state<&EntityState::usage>,
     about("Whether the entity is in use and has capacity left").oneOf(kEntStateUsage)},
    {"entStateAlarm", 5, Octets, alarm,
     about("The severities of the alarms that the entity has").oneOf(kEntStateAlarm)},
    {"entStateStandby", 6, Integer, state<&EntityState::standby>,
     about("Whether the entity works or waits for another to fail").oneOf(kEntStateStandby)},
};

} // namespace

Table const& entStateTable() {
    static RowTable<Row, stateRows> const table("entStateTable", {131, 1, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
