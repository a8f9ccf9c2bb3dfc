// SPDX-License-Identifier: BSD-2-Clause
// kvlModuleTable and kvlServiceTable.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;

constexpr Column<ModuleRow> kModuleColumns[] = {
    {"kvlModuleName", 2, Text, text<&ModuleRow::name>,
     about("The name of the module's library").identifies()},
    {"kvlModulePurpose", 3, Text, text<&ModuleRow::purpose>,
     about("The purpose of the module, in words")},
    {"kvlModuleVersion", 4, Text, text<&ModuleRow::version>, about("The module's version")},
    {"kvlModuleDate", 5, Date, textIfKnown<&ModuleRow::date>, about("When the module was loaded")},
};

constexpr Column<ServiceRow> kServiceColumns[] = {
    {"kvlServiceName", 2, Text, text<&ServiceRow::name>, about("The service's name").identifies()},
    {"kvlServiceScmName", 3, Text, text<&ServiceRow::scmName>,
     about("The name of the service in the host's service control")},
    {"kvlServiceStatus", 4, Integer, number<&ServiceRow::status>,
     about("The service's status").as(Kind::State)},
    {"kvlServiceChangeDate", 5, Date, textIfKnown<&ServiceRow::changeDate>,
     about("When kvlServiceStatus last changed")},
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
