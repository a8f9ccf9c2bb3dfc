// SPDX-License-Identifier: BSD-2-Clause
// kvlProcessTable: statistics of the processes that use the platform's runtime library.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

template <std::uint32_t ProcessRow::*Field>
Value count(ProcessRow const& row) {
    return std::int64_t{row.*Field};
}

using enum ValueType;

constexpr Column<ProcessRow> kColumns[] = {
    {"kvlProcessName", 2, Text, textIfKnown<&ProcessRow::name>,
     about("The name of the process's program").identifies()},
    {"kvlProcessOpens", 3, Counter, count<&ProcessRow::opens>,
     about("How many times the process has opened a device").in("opens")},
    {"kvlProcessCloses", 4, Counter, count<&ProcessRow::closes>,
     about("How many times the process has closed a device").in("closes")},
    {"kvlProcessEventQueueSize", 5, Gauge, number<&ProcessRow::eventQueueSize>,
     about("The capacity of the process's event queue").in("events")},
    {"kvlProcessCurrentEvents", 6, Gauge, number<&ProcessRow::currentEvents>,
     about("The number of events now in the queue").in("events")},
    {"kvlProcessMaxEvents", 7, Gauge, number<&ProcessRow::maxEvents>,
     about("The largest number of events that have been in the queue").in("events")},
    {"kvlProcessTotalEvents", 8, Counter, count<&ProcessRow::totalEvents>,
     about("The total number of events that have been put into the queue").in("events")},
    {"kvlProcessHandlers", 9, Gauge, number<&ProcessRow::handlers>,
     about("The number of event handlers that the process has installed").in("handlers")},
};

} // namespace

Table const& processTable() {
    static RowTable<ProcessRow, &Snapshot::processes> const table("kvlProcessTable",
                                                                  {1, 1, 7, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
