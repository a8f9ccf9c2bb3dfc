// SPDX-License-Identifier: BSD-2-Clause
// IF-MIB's tables: the interfaces.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// RowStatus's.
constexpr std::int64_t kActive = 1;

Value index(InterfaceRow const& row) {
    return std::int64_t{row.ifIndex};
}

template <InterfaceCounter Counter>
Value count32(InterfaceRow const& row) {
    auto const& counter = row.counters[Counter];
    return counter ? Value{std::int64_t{static_cast<std::uint32_t>(*counter)}} : Value{};
}

template <InterfaceCounter Counter>
Value count64(InterfaceRow const& row) {
    auto const& counter = row.counters[Counter];
    return counter ? Value{static_cast<std::int64_t>(*counter)} : Value{};
}

/// Millions of bits a second, rounded.
Value highSpeed(InterfaceRow const& row) {
    if (!row.speed) return {};
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

using enum ValueType;
using Row = InterfaceRow;

constexpr Writable kTraps{Setting::LinkUpDownTraps, kEnabled, kDisabled};
constexpr int kLongestAlias = 64;
constexpr Writable kAlias{Setting::InterfaceAlias, 0, kLongestAlias, Characters::Ascii};

constexpr Column<Row> kColumns[] = {
    {"ifIndex", 1, Integer, index},
    {"ifDescr", 2, Text, text<&Row::description>},
    {"ifType", 3, Integer, number<&Row::type>},
    {"ifMtu", 4, Integer, number<&Row::mtu>},
    {"ifSpeed", 5, Gauge, number<&Row::speed>},
    {"ifPhysAddress", 6, Octets, textIfKnown<&Row::physAddress>},
    {"ifAdminStatus", 7, Integer, number<&Row::adminStatus>},
    {"ifOperStatus", 8, Integer, number<&Row::operStatus>},
    {"ifLastChange", 9, TimeStamp, number<&Row::lastChange>},
    {"ifInOctets", 10, Counter, count32<kInOctets>},
    {"ifInUcastPkts", 11, Counter, count32<kInUcastPkts>},
    {"ifInDiscards", 13, Counter, count32<kInDiscards>},
    {"ifInErrors", 14, Counter, count32<kInErrors>},
    {"ifInUnknownProtos", 15, Counter, count32<kInUnknownProtos>},
    {"ifOutOctets", 16, Counter, count32<kOutOctets>},
    {"ifOutUcastPkts", 17, Counter, count32<kOutUcastPkts>},
    {"ifOutDiscards", 19, Counter, count32<kOutDiscards>},
    {"ifOutErrors", 20, Counter, count32<kOutErrors>},
};

constexpr Column<Row> kMoreColumns[] = {
    {"ifName", 1, Text, text<&Row::name>},
    {"ifHCInOctets", 6, Counter64, count64<kInOctets>},
    {"ifHCInUcastPkts", 7, Counter64, count64<kInUcastPkts>},
    {"ifHCOutOctets", 10, Counter64, count64<kOutOctets>},
    {"ifHCOutUcastPkts", 11, Counter64, count64<kOutUcastPkts>},
    {"ifLinkUpDownTrapEnable", 14, Integer, linkUpDownTraps, kTraps},
    {"ifHighSpeed", 15, Gauge, highSpeed},
    {"ifConnectorPresent", 17, Integer, number<&Row::connectorPresent>},
    {"ifAlias", 18, Text, alias, kAlias},
    {"ifCounterDiscontinuityTime", 19, TimeStamp, discontinuity},
};

constexpr Column<StackRow> kStackColumns[] = {
    {"ifStackStatus", 3, Integer, stackStatus},
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

} // namespace kvloamd
