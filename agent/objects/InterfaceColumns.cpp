// SPDX-License-Identifier: BSD-2-Clause
// kvlInterfaceTable: which board an interface belongs to.
#include "agent/objects/EntityColumnTable.h"
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;
using Row = InterfaceRow;

/// An index of another table; 0 is none.
template <auto Field>
Value reference(Row const& row) {
    return row.*Field == 0 ? Value{} : Value{std::int64_t{row.*Field}};
}

constexpr Column<Row> kColumns[] = {
    {"kvlInterfaceBoardIndex", 2, Integer, reference<&Row::boardIndex>,
     about("The interface's board")},
    {"kvlInterfaceBoardSerialNumber", 3, Text, text<&Row::boardSerialNumber>,
     about("The serial number of the interface's board").identifies()},
    {"kvlInterfacePhysicalIndex", 4, Integer, notOfTheRow<Row>,
     about("The physical entity that the interface is or belongs to")},
};

auto const& rows(Snapshot const& snapshot) {
    return snapshot.interfaces.interfaces;
}

} // namespace

Table const& interfaceTable() {
    static EntityColumnTable<Row, rows, &EntityRows::ofInterfaces> const table(
        "kvlInterfaceTable", {1, 1, 10, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
