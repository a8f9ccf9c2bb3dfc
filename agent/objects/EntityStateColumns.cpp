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

constexpr Column<Row> kColumns[] = {
    {"entStateLastChanged", 1, Date, textIfKnown<&Row::changed>},
    {"entStateAdmin", 2, Integer, state<&EntityState::admin>},
    {"entStateOper", 3, Integer, state<&EntityState::oper>},
    {"entStateUsage", 4, Integer, state<&EntityState::usage>},
    {"entStateAlarm", 5, Octets, alarm},
    {"entStateStandby", 6, Integer, state<&EntityState::standby>},
};

} // namespace

Table const& entStateTable() {
    static RowTable<Row, stateRows> const table("entStateTable", {131, 1, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
