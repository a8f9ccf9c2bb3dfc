// SPDX-License-Identifier: BSD-2-Clause
// EtherLike-MIB's dot3StatsTable: what Ethernet interfaces count of their own.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

Value index(EthernetRow const& row) {
    return std::int64_t{row.ifIndex};
}

using enum ValueType;
using Row = EthernetRow;

constexpr Column<Row> kColumns[] = {
    {"dot3StatsIndex", 1, Integer, index},
    {"dot3StatsAlignmentErrors", 2, Counter, number<&Row::alignmentErrors>},
    {"dot3StatsFCSErrors", 3, Counter, number<&Row::fcsErrors>},
    {"dot3StatsSingleCollisionFrames", 4, Counter, number<&Row::singleCollisionFrames>},
    {"dot3StatsMultipleCollisionFrames", 5, Counter, number<&Row::multipleCollisionFrames>},
    {"dot3StatsSQETestErrors", 6, Counter, number<&Row::sqeTestErrors>},
    {"dot3StatsDeferredTransmissions", 7, Counter, number<&Row::deferredTransmissions>},
    {"dot3StatsLateCollisions", 8, Counter, number<&Row::lateCollisions>},
    {"dot3StatsExcessiveCollisions", 9, Counter, number<&Row::excessiveCollisions>},
    {"dot3StatsInternalMacTransmitErrors", 10, Counter, number<&Row::internalMacTransmitErrors>},
    {"dot3StatsCarrierSenseErrors", 11, Counter, number<&Row::carrierSenseErrors>},
    {"dot3StatsFrameTooLongs", 13, Counter, number<&Row::frameTooLongs>},
    {"dot3StatsInternalMacReceiveErrors", 16, Counter, number<&Row::internalMacReceiveErrors>},
    {"dot3StatsSymbolErrors", 18, Counter, number<&Row::symbolErrors>},
    {"dot3StatsDuplexStatus", 19, Integer, number<&Row::duplexStatus>},
};

} // namespace

Table const& dot3StatsTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::ethernets>> const table(
        "dot3StatsTable", {10, 7, 2, 1}, kColumns);
    return table;
}

} // namespace kvloamd
