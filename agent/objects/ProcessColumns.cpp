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
    {"kvlProcessName", 2, Text, textIfKnown<&ProcessRow::name>},
    {"kvlProcessOpens", 3, Counter, count<&ProcessRow::opens>},
    {"kvlProcessCloses", 4, Counter, count<&ProcessRow::closes>},
    {"kvlProcessEventQueueSize", 5, Gauge, number<&ProcessRow::eventQueueSize>},
    {"kvlProcessCurrentEvents", 6, Gauge, number<&ProcessRow::currentEvents>},
    {"kvlProcessMaxEvents", 7, Gauge, number<&ProcessRow::maxEvents>},
    {"kvlProcessTotalEvents", 8, Counter, count<&ProcessRow::totalEvents>},
    {"kvlProcessHandlers", 9, Gauge, number<&ProcessRow::handlers>},
};

} // namespace

Table const& processTable() {
    static RowTable<ProcessRow, &Snapshot::processes> const table("kvlProcessTable",
                                                                  {1, 1, 7, 1, 1}, kColumns);
    return table;
}

} // namespace kvloamd
