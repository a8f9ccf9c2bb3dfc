// SPDX-License-Identifier: BSD-2-Clause
// IF-MIB's tables: the interfaces.
#include "agent/objects/RowValues.h"
#include "agent/objects/SharedNames.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// RowStatus's.
constexpr std::int64_t kActive = 1;

// ifRcvAddressType's.
constexpr std::int64_t kVolatile = 2;
constexpr std::int64_t kNonVolatile = 3;

Value index(InterfaceRow const& row) {
    return std::int64_t{row.ifIndex};
}

/// Millions of bits a second, rounded.
Value highSpeed(InterfaceRow const& row) {
    if (row.highSpeed) return std::int64_t{*row.highSpeed};
    if (!row.speed || *row.speed == kMostSpeed) return {};
    return std::int64_t{*row.speed / 1'000'000 + (*row.speed % 1'000'000 >= 500'000 ? 1 : 0)};
}

/// Empty until it is set.
Value alias(InterfaceRow const& /*row*/) {
    return std::string_view();
}

Value linkUpDownTraps(InterfaceRow const& row) {
    return std::int64_t{row.linkUpDownTraps};
}

Value discontinuity(InterfaceRow const& row) {
    return std::int64_t{row.discontinuity};
}

Value stackStatus(StackRow const& /*row*/) {
    return kActive;
}

Value addressStatus(ReceiveAddressRow const& /*row*/) {
    return kActive;
}

/// An interface has its own address again after a restart, and all others only if they are asked
/// for again.
Value addressType(ReceiveAddressRow const& row) {
    return row.isOwn ? kNonVolatile : kVolatile;
}

using enum ValueType;
using Row = InterfaceRow;

constexpr Writable kTraps{Setting::LinkUpDownTraps, kEnabled, kDisabled};
constexpr int kLongestAlias = 64;
constexpr Writable kAlias{Setting::InterfaceAlias, 0, kLongestAlias, Characters::Ascii};

constexpr NamedNumber kIfType[] = {
    {1, "other"},        {6, "ethernetCsmacd"}, {18, "ds1"},  {19, "e1"},  {24, "softwareLoopback"},
    {53, "propVirtual"}, {63, "isdn"},          {77, "lapd"}, {81, "ds0"}, {126, "ip"},
    {131, "tunnel"},     {135, "l2vlan"}};

constexpr NamedNumber kIfAdminStatus[] = {{1, "up"}, {2, "down"}, {3, "testing"}};

constexpr NamedNumber kIfOperStatus[] = {
    {1, "up"},      {2, "down"},       {3, "testing"},       {4, "unknown"},
    {5, "dormant"}, {6, "notPresent"}, {7, "lowerLayerDown"}};

constexpr NamedNumber kEnabling[] = {{1, "enabled"}, {2, "disabled"}};

constexpr NamedNumber kTruthValues[] = {{1, "true"}, {2, "false"}};

constexpr NamedNumber kIfRcvAddressType[] = {{1, "other"}, {2, "volatile"}, {3, "nonVolatile"}};

constexpr Column<Row> kColumns[] = {
    {"ifIndex", 1, Integer, index, about("The number of the interface")},
    {"ifDescr", 2, Text, text<&Row::description>,
     about("What the interface is, in words").identifies()},
    {"ifType", 3, Integer, number<&Row::type>,
     about("The kind of the interface").someOf(kIfType).as(Kind::Information)},
    {"ifMtu", 4, Integer, number<&Row::mtu>,
     about("The largest packet, in octets, that the interface sends or receives").in("octets")},
    {"ifSpeed", 5, Gauge, number<&Row::speed>,
     about("The bandwidth in bits per second").in("bits per second")},
    {"ifPhysAddress", 6, Octets, text<&Row::physAddress>,
     about("The address of the interface in its own layer")},
    {"ifAdminStatus", 7, Integer, number<&Row::adminStatus>,
     about("The state that the interface is meant to have").oneOf(kIfAdminStatus)},
    {"ifOperStatus", 8, Integer, number<&Row::operStatus>,
     about("The state that the interface has").oneOf(kIfOperStatus)},
    {"ifLastChange", 9, TimeStamp, number<&Row::lastChange>,
     about("The value of sysUpTime when the interface entered the state that it has")},
    {"ifInOctets", 10, Counter, count32<kInOctets>,
     about("Octets received, framing included").in("octets")},
    {"ifInUcastPkts", 11, Counter, count32<kInUcastPkts>,
     about("Packets received for this interface alone and passed up").in("packets")},
    {"ifInDiscards", 13, Counter, count32<kInDiscards>,
     about("Packets received without a fault and dropped all the same")},
    {"ifInErrors", 14, Counter, count32<kInErrors>,
     about("Packets or transmission units received with a fault")},
    {"ifInUnknownProtos", 15, Counter, count32<kInUnknownProtos>,
     about("Packets received of a protocol that is not known")},
    {"ifOutOctets", 16, Counter, count32<kOutOctets>,
     about("Octets sent, framing included").in("octets")},
    {"ifOutUcastPkts", 17, Counter, count32<kOutUcastPkts>,
     about("Packets from above that were meant for one receiver").in("packets")},
    {"ifOutDiscards", 19, Counter, count32<kOutDiscards>,
     about("Packets without a fault that were dropped instead of sent")},
    {"ifOutErrors", 20, Counter, count32<kOutErrors>,
     about("Packets or transmission units that could not be sent because of faults")},
};

constexpr Column<Row> kMoreColumns[] = {
    {"ifName", 1, Text, text<&Row::name>,
     about("The name of the interface on the system's own console").identifies()},
    {"ifInMulticastPkts", 2, Counter, count32<kInMulticastPkts>,
     about("Packets received for a group of receivers and passed up").in("packets")},
    {"ifInBroadcastPkts", 3, Counter, count32<kInBroadcastPkts>,
     about("Packets received for all receivers and passed up").in("packets")},
    {"ifOutMulticastPkts", 4, Counter, count32<kOutMulticastPkts>,
     about("Packets from above that were meant for a group of receivers").in("packets")},
    {"ifOutBroadcastPkts", 5, Counter, count32<kOutBroadcastPkts>,
     about("Packets from above that were meant for all receivers").in("packets")},
    {"ifHCInOctets", 6, Counter64, count64<kInOctets>,
     about("As ifInOctets, with 64 bits").in("octets")},
    {"ifHCInUcastPkts", 7, Counter64, count64<kInUcastPkts>,
     about("As ifInUcastPkts, with 64 bits").in("packets")},
    {"ifHCInMulticastPkts", 8, Counter64, count64<kInMulticastPkts>,
     about("As ifInMulticastPkts, with 64 bits").in("packets")},
    {"ifHCInBroadcastPkts", 9, Counter64, count64<kInBroadcastPkts>,
     about("As ifInBroadcastPkts, with 64 bits").in("packets")},
    {"ifHCOutOctets", 10, Counter64, count64<kOutOctets>,
     about("As ifOutOctets, with 64 bits").in("octets")},
    {"ifHCOutUcastPkts", 11, Counter64, count64<kOutUcastPkts>,
     about("As ifOutUcastPkts, with 64 bits").in("packets")},
    {"ifHCOutMulticastPkts", 12, Counter64, count64<kOutMulticastPkts>,
     about("As ifOutMulticastPkts, with 64 bits").in("packets")},
    {"ifHCOutBroadcastPkts", 13, Counter64, count64<kOutBroadcastPkts>,
     about("As ifOutBroadcastPkts, with 64 bits").in("packets")},
    {"ifLinkUpDownTrapEnable", 14, Integer, linkUpDownTraps,
     about("Whether linkUp and linkDown are sent for the interface")
         .oneOf(kEnabling)
         .settable(kTraps)
         .as(Kind::Information)},
    {"ifHighSpeed", 15, Gauge, highSpeed,
     about("The bandwidth in millions of bits per second").in("millions of bits per second")},
    {"ifPromiscuousMode", 16, Integer, number<&Row::promiscuousMode>,
     about("Whether the interface receives packets for other receivers too")
         .oneOf(kTruthValues)
         .as(Kind::Information)},
    {"ifConnectorPresent", 17, Integer, number<&Row::connectorPresent>,
     about("Whether the interface has a connector").oneOf(kTruthValues).as(Kind::Information)},
    {"ifAlias", 18, Text, alias,
     about("The name that the operator has given to the interface").settable(kAlias)},
    {"ifCounterDiscontinuityTime", 19, BeginStamp, discontinuity,
     about("The value of sysUpTime when a counter of the interface last jumped")},
};

constexpr Column<StackRow> kStackColumns[] = {
    {"ifStackStatus", 3, Integer, stackStatus,
     about("The state of the row").oneOf(kRowStates).as(Kind::Information)},
};

constexpr Column<ReceiveAddressRow> kAddressColumns[] = {
    {"ifRcvAddressStatus", 2, Integer, addressStatus,
     about("The state of the row").oneOf(kRowStates).as(Kind::Information)},
    {"ifRcvAddressType", 3, Integer, addressType,
     about("Whether the address outlives a restart")
         .oneOf(kIfRcvAddressType)
         .as(Kind::Information)},
};

} // namespace

Table const& ifTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::interfaces>> const table(
        "ifTable", {2, 2, 1}, kColumns);
    return table;
}

Table const& ifXTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::interfaces>> const table(
        "ifXTable", {31, 1, 1, 1}, kMoreColumns);
    return table;
}

Table const& ifStackTable() {
    static RowTable<StackRow, interfaceRows<&InterfaceRows::stack>> const table(
        "ifStackTable", {31, 1, 2, 1}, kStackColumns);
    return table;
}

Table const& ifRcvAddressTable() {
    static RowTable<ReceiveAddressRow, interfaceRows<&InterfaceRows::receiveAddresses>> const table(
        "ifRcvAddressTable", {31, 1, 4, 1}, kAddressColumns);
    return table;
}

} // namespace kvloamd
