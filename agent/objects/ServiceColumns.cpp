// SPDX-License-Identifier: BSD-2-Clause
// kvlModuleTable and kvlServiceTable.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;

constexpr Column<ModuleRow> kModuleColumns[] = {
    {"kvlModuleName", 2, Text, text<&ModuleRow::name>},
    {"kvlModulePurpose", 3, Text, text<&ModuleRow::purpose>},
    {"kvlModuleVersion", 4, Text, text<&ModuleRow::version>},
    {"kvlModuleDate", 5, Date, textIfKnown<&ModuleRow::date>},
};

constexpr Column<ServiceRow> kServiceColumns[] = {
    {"kvlServiceName", 2, Text, text<&ServiceRow::name>},
    {"kvlServiceScmName", 3, Text, text<&ServiceRow::scmName>},
    {"kvlServiceStatus", 4, Integer, number<&ServiceRow::status>},
    {"kvlServiceChangeDate", 5, Date, textIfKnown<&ServiceRow::changeDate>},
};

} // namespace

Table const& moduleTable() {
    static RowTable<ModuleRow, &Snapshot::modules> const table("kvlModuleTable", {1, 1, 4, 3, 1},
                                                               kModuleColumns);
    return table;
}

Table const& serviceTable() {
    static RowTable<ServiceRow, &Snapshot::services> const table("kvlServiceTable", {1, 1, 4, 4, 1},
                                                                 kServiceColumns);
    return table;
}

} // namespace kvloamd
