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

constexpr NamedNumber kIsdnBearerChannelType[] = {{1, "dialup"}, {2, "leased"}};

constexpr NamedNumber kIsdnBearerOperStatus[] = {
    {1, "idle"}, {2, "connecting"}, {3, "connected"}, {4, "active"}};

constexpr NamedNumber kIsdnSignalingProtocol[] = {
    {1, "other"},  {2, "dss1"},   {3, "etsi"},     {4, "dass2"},      {5, "ess4"},
    {6, "ess5"},   {7, "dms100"}, {8, "dms250"},   {9, "ni1"},        {10, "ni2"},
    {11, "ni3"},   {12, "vn2"},   {13, "vn3"},     {14, "vn4"},       {15, "vn6"},
    {16, "kdd"},   {17, "ins64"}, {18, "ins1500"}, {19, "itr6"},      {20, "cornet"},
    {21, "ts013"}, {22, "ts014"}, {23, "qsig"},    {24, "swissnet2"}, {25, "swissnet3"}};

constexpr NamedNumber kIsdnLapdOperStatus[] = {{1, "inactive"}, {2, "l1Active"}, {3, "l2Active"}};

constexpr Column<BearerRow> kBearerColumns[] = {
    {"isdnBearerChannelType", 1, Integer, number<&BearerRow::channelType>,
     about("Whether the channel is dialled or leased")
         .oneOf(kIsdnBearerChannelType)
         .as(Kind::Information)},
    {"isdnBearerOperStatus", 2, Integer, number<&BearerRow::operStatus>,
     about("How far the call on the channel has come").oneOf(kIsdnBearerOperStatus)},
    {"isdnBearerChannelNumber", 3, Integer, number<&BearerRow::channelNumber>,
     about("The number of the channel on its interface")},
};

constexpr Column<SignallingRow> kSignallingColumns[] = {
    {"isdnSignalingIfIndex", 2, Integer, ifIndex,
     about("The interface that is the signalling channel")},
    {"isdnSignalingProtocol", 3, Integer, number<&SignallingRow::protocol>,
     about("The protocol of the channel").oneOf(kIsdnSignalingProtocol).as(Kind::Information)},
    {"isdnSignalingCallingAddress", 4, Text, text<&SignallingRow::callingAddress>,
     about("The calling address for outgoing calls")},
    {"isdnSignalingBchannelCount", 6, Integer, number<&SignallingRow::bearerCount>,
     about("How many bearer channels the channel controls")},
};

constexpr Column<LapdRow> kLapdColumns[] = {
    {"isdnLapdOperStatus", 2, Integer, number<&LapdRow::operStatus>,
     about("The state of the data link").oneOf(kIsdnLapdOperStatus)},
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
