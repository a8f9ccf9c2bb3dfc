// SPDX-License-Identifier: BSD-2-Clause
// kvlFaultTable.
#include "agent/objects/OwnObjects.h"
#include "agent/objects/RowValues.h"

namespace kvloamd {

namespace {

using enum ValueType;

Value kind(FaultRow const& row) {
    return std::int64_t{faultKind(row.value)};
}

constexpr NamedNumber kKinds[] = {
    {kOtherFault, "other"},
    {256, "lossOfSignal"},
    {257, "lossOfFrame"},
    {258, "receivingAis"},
    {259, "receivingRai"},
    {260, "sendingRai"},
    {261, "sendingAis"},
    {262, "loopback"},
    {263, "receivingTimeSlot16Ais"},
    {264, "receivingRemoteMultiframeAlarm"},
    {265, "sendingRemoteMultiframeAlarm"},
    {266, "receivingTestCode"},
};

constexpr Column<FaultRow> kColumns[] = {
    {"kvlFaultTime", 3, TimeStamp, plain<&FaultRow::time>, about("When the fault was raised")},
    {"kvlFaultDate", 4, Date, textIfKnown<&FaultRow::date>,
     about("The date at which the fault was raised")},
    {"kvlFaultTimesRaised", 5, Counter, plain<&FaultRow::times>,
     about("How many times the fault has been raised since kvlFaultTime").in("times")},
    {"kvlFaultPlatformBoard", 6, Integer, plain<&FaultRow::platformBoard>,
     about("The board number that the platform used")},
    {"kvlFaultKind", 7, Integer, kind,
     about("What the fault is").oneOf(kKinds).identifies().as(Kind::Information)},
};

std::vector<FaultRow> const& rows(Snapshot const& snapshot) {
    return snapshot.faults.rows;
}

} // namespace

Table const& faultTable() {
    static RowTable<FaultRow, rows> const table("kvlFaultTable", {1, 1, 8, 5, 1}, kColumns);
    return table;
}

} // namespace kvloamd
