// SPDX-License-Identifier: BSD-2-Clause
// ISDN-MIB's tables: the bearer channels, the signalling channels and their data links.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

Value ifIndex(SignallingRow const& row) {
    return std::int64_t{row.ifIndex};
}

using enum ValueType;

constexpr Column<BearerRow> kBearerColumns[] = {
    {"isdnBearerChannelType", 1, Integer, number<&BearerRow::channelType>},
    {"isdnBearerOperStatus", 2, Integer, number<&BearerRow::operStatus>},
    {"isdnBearerChannelNumber", 3, Integer, number<&BearerRow::channelNumber>},
};

constexpr Column<SignallingRow> kSignallingColumns[] = {
    {"isdnSignalingIfIndex", 2, Integer, ifIndex},
    {"isdnSignalingProtocol", 3, Integer, number<&SignallingRow::protocol>},
    {"isdnSignalingCallingAddress", 4, Text, text<&SignallingRow::callingAddress>},
    {"isdnSignalingBchannelCount", 6, Integer, number<&SignallingRow::bearerCount>},
};

constexpr Column<LapdRow> kLapdColumns[] = {
    {"isdnLapdOperStatus", 2, Integer, number<&LapdRow::operStatus>},
};

} // namespace

Table const& isdnBearerTable() {
    static RowTable<BearerRow, interfaceRows<&InterfaceRows::bearers>> const table(
        "isdnBearerTable", {10, 20, 1, 2, 1, 1}, kBearerColumns);
    return table;
}

Table const& isdnSignalingTable() {
    static RowTable<SignallingRow, interfaceRows<&InterfaceRows::signalling>> const table(
        "isdnSignalingTable", {10, 20, 1, 3, 2, 1}, kSignallingColumns);
    return table;
}

Table const& isdnLapdTable() {
    static RowTable<LapdRow, interfaceRows<&InterfaceRows::lapds>> const table(
        "isdnLapdTable", {10, 20, 1, 3, 4, 1}, kLapdColumns);
    return table;
}

} // namespace kvloamd
