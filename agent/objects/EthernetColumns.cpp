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

constexpr NamedNumber kDot3StatsDuplexStatus[] = {
    {1, "unknown"}, {2, "halfDuplex"}, {3, "fullDuplex"}};

constexpr Column<Row> kColumns[] = {
    {"dot3StatsIndex", 1, Integer, index, about("The interface")},
    {"dot3StatsAlignmentErrors", 2, Counter, number<&Row::alignmentErrors>,
     about("Frames received with a wrong checksum and a broken last octet")},
    {"dot3StatsFCSErrors", 3, Counter, number<&Row::fcsErrors>,
     about("Frames received with a wrong checksum and whole octets")},
    {"dot3StatsSingleCollisionFrames", 4, Counter, number<&Row::singleCollisionFrames>,
     about("Frames sent after one collision")},
    {"dot3StatsMultipleCollisionFrames", 5, Counter, number<&Row::multipleCollisionFrames>,
     about("Frames sent after several collisions")},
    {"dot3StatsSQETestErrors", 6, Counter, number<&Row::sqeTestErrors>,
     about("Failed tests of the collision signal")},
    {"dot3StatsDeferredTransmissions", 7, Counter, number<&Row::deferredTransmissions>,
     about("Frames whose first attempt had to wait for the medium")},
    {"dot3StatsLateCollisions", 8, Counter, number<&Row::lateCollisions>,
     about("Collisions later than the medium permits")},
    {"dot3StatsExcessiveCollisions", 9, Counter, number<&Row::excessiveCollisions>,
     about("Frames given up after too many collisions")},
    {"dot3StatsInternalMacTransmitErrors", 10, Counter, number<&Row::internalMacTransmitErrors>,
     about("Frames not sent because of a fault of the controller")},
    {"dot3StatsCarrierSenseErrors", 11, Counter, number<&Row::carrierSenseErrors>,
     about("Frames during which the carrier was lost or never there")},
    {"dot3StatsFrameTooLongs", 13, Counter, number<&Row::frameTooLongs>,
     about("Frames received that are longer than permitted")},
    {"dot3StatsInternalMacReceiveErrors", 16, Counter, number<&Row::internalMacReceiveErrors>,
     about("Frames lost in reception because of a fault of the controller")},
    {"dot3StatsSymbolErrors", 18, Counter, number<&Row::symbolErrors>,
     about("Symbols received that are not valid")},
    {"dot3StatsDuplexStatus", 19, Integer, number<&Row::duplexStatus>,
     about("Whether the interface sends and receives at the same time")
         .oneOf(kDot3StatsDuplexStatus)},
};

} // namespace

Table const& dot3StatsTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::ethernets>> const table(
        "dot3StatsTable", {10, 7, 2, 1}, kColumns);
    return table;
}

} // namespace kvloamd
