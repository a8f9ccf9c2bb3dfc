// SPDX-License-Identifier: BSD-2-Clause
// ISDN-MIB's tables: the bearer channels, the signalling channels and their data links.
#include "agent/objects/RowValues.h"
#include "agent/objects/SharedNames.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// RowStatus's.
constexpr std::int64_t kActive = 1;

Value ifIndex(SignallingRow const& row) {
    return std::int64_t{row.ifIndex};
}

Value trapsDisabled(SignallingRow const& /*row*/) {
    return std::int64_t{kDisabled};
}

Value active(SignallingRow const& /*row*/) {
    return kActive;
}

/// No channel stands in for another.
Value primary(LapdRow const& /*row*/) {
    return std::int64_t{kTrue};
}

template <auto Field>
Value callText(BearerRow const& row) {
    return std::string_view(row.call.*Field);
}

template <auto Field>
Value callNumber(BearerRow const& row) {
    return std::int64_t{row.call.*Field};
}

using enum ValueType;
using Signalling = SignallingRow;

constexpr Writable kTraps{Setting::CallInformationTraps, kEnabled, kDisabled};

constexpr NamedNumber kTruthValues[] = {{1, "true"}, {2, "false"}};

constexpr NamedNumber kTrapEnables[] = {{1, "enabled"}, {2, "disabled"}};

constexpr NamedNumber kIsdnBearerCallOrigin[] = {
    {1, "unknown"}, {2, "originate"}, {3, "answer"}, {4, "callback"}};

constexpr NamedNumber kIsdnBearerInfoType[] = {{1, "unknown"},
                                               {2, "speech"},
                                               {3, "unrestrictedDigital"},
                                               {4, "unrestrictedDigital56"},
                                               {5, "restrictedDigital"},
                                               {6, "audio31"},
                                               {7, "audio7"},
                                               {8, "video"},
                                               {9, "packetSwitched"}};

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
    {"isdnBearerPeerAddress", 4, Text, callText<&CallRow::peerAddress>,
     about("The address of the peer of the present or last call")},
    {"isdnBearerPeerSubAddress", 5, Text, callText<&CallRow::peerSubAddress>,
     about("The subaddress of the peer of the present or last call")},
    {"isdnBearerCallOrigin", 6, Integer, callNumber<&CallRow::origin>,
     about("Who began the present or last call")
         .oneOf(kIsdnBearerCallOrigin)
         .as(Kind::Information)},
    {"isdnBearerInfoType", 7, Integer, callNumber<&CallRow::informationType>,
     about("What the present or last call carries")
         .oneOf(kIsdnBearerInfoType)
         .as(Kind::Information)},
    {"isdnBearerMultirate", 8, Integer, callNumber<&CallRow::multirate>,
     about("Whether the present or last call has several channels")
         .oneOf(kTruthValues)
         .as(Kind::Information)},
    {"isdnBearerCallSetupTime", 9, TimeStamp, callNumber<&CallRow::setupTime>,
     about("The value of sysUpTime when the present or last call was begun")},
    {"isdnBearerCallConnectTime", 10, TimeStamp, callNumber<&CallRow::connectTime>,
     about("The value of sysUpTime when the present or last call was connected")},
    {"isdnBearerChargedUnits", 11, Gauge, callNumber<&CallRow::chargedUnits>,
     about("The units charged for the present or last call").in("units")},
};

constexpr Column<SignallingRow> kSignallingColumns[] = {
    {"isdnSignalingIfIndex", 2, Integer, ifIndex,
     about("The interface that is the signalling channel")},
    {"isdnSignalingProtocol", 3, Integer, number<&SignallingRow::protocol>,
     about("The protocol of the channel").oneOf(kIsdnSignalingProtocol).as(Kind::Information)},
    {"isdnSignalingCallingAddress", 4, Text, text<&SignallingRow::callingAddress>,
     about("The calling address for outgoing calls")},
    {"isdnSignalingSubAddress", 5, Text, text<&SignallingRow::callingSubAddress>,
     about("The subaddress for outgoing calls")},
    {"isdnSignalingBchannelCount", 6, Integer, number<&SignallingRow::bearerCount>,
     about("How many bearer channels the channel controls")},
    {"isdnSignalingInfoTrapEnable", 7, Integer, trapsDisabled,
     about("Whether calls are announced")
         .oneOf(kTrapEnables)
         .settable(kTraps)
         .as(Kind::Information)},
    {"isdnSignalingStatus", 8, Integer, active, about("The status of the row").oneOf(kRowStates)},
};

constexpr Column<Signalling> kStatisticsColumns[] = {
    {"isdnSigStatsInCalls", 1, Counter, number<&Signalling::inCalls>,
     about("Incoming calls").in("calls")},
    {"isdnSigStatsInConnected", 2, Counter, number<&Signalling::inConnected>,
     about("Incoming calls that were connected").in("calls")},
    {"isdnSigStatsOutCalls", 3, Counter, number<&Signalling::outCalls>,
     about("Outgoing calls").in("calls")},
    {"isdnSigStatsOutConnected", 4, Counter, number<&Signalling::outConnected>,
     about("Outgoing calls that were connected").in("calls")},
    {"isdnSigStatsChargedUnits", 5, Counter, number<&Signalling::chargedUnits>,
     about("The units charged for all calls").in("units")},
};

constexpr Column<LapdRow> kLapdColumns[] = {
    {"isdnLapdPrimaryChannel", 1, Integer, primary,
     about("Whether the channel is not a backup of another")
         .oneOf(kTruthValues)
         .as(Kind::Information)},
    {"isdnLapdOperStatus", 2, Integer, number<&LapdRow::operStatus>,
     about("The state of the data link").oneOf(kIsdnLapdOperStatus)},
    {"isdnLapdPeerSabme", 3, Counter, number<&LapdRow::peerSabme>,
     about("SABME frames received from the peer").in("frames")},
    {"isdnLapdRecvdFrmr", 4, Counter, number<&LapdRow::recvdFrmr>,
     about("FRMR frames received from the peer").in("frames")},
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

Table const& isdnSignalingStatsTable() {
    static RowTable<Signalling, interfaceRows<&InterfaceRows::signalling>> const table(
        "isdnSignalingStatsTable", {10, 20, 1, 3, 3, 1}, kStatisticsColumns);
    return table;
}

Table const& isdnLapdTable() {
    static RowTable<LapdRow, interfaceRows<&InterfaceRows::lapds>> const table(
        "isdnLapdTable", {10, 20, 1, 3, 4, 1}, kLapdColumns);
    return table;
}

} // namespace kvloamd
