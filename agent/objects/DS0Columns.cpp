// SPDX-License-Identifier: BSD-2-Clause
// DS0-MIB's tables: the bearer channels as DS0 channels, and their places in lines.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

/// Bearer channels are signalled for in another channel: they have no bits robbed and send no
/// codes.
Value no(BearerRow const& /*row*/) {
    return std::int64_t{kFalse};
}

Value circuit(BearerRow const& /*row*/) {
    return std::string_view();
}

Value bundle(BearerRow const& /*row*/) {
    return std::int64_t{0};
}

Value channel(Ds0ChannelRow const& row) {
    return std::int64_t{row.channel};
}

using enum ValueType;

constexpr NamedNumber kTruthValues[] = {{1, "true"}, {2, "false"}};

constexpr Column<BearerRow> kConfigColumns[] = {
    {"dsx0Ds0ChannelNumber", 1, Integer, number<&BearerRow::timeSlot>,
     about("The number of the channel on its line")},
    {"dsx0RobbedBitSignalling", 2, Integer, no,
     about("Whether signalling takes bits of the channel").oneOf(kTruthValues)},
    {"dsx0CircuitIdentifier", 3, Text, circuit,
     about("The name that the carrier has given to the circuit")},
    {"dsx0TransmitCodesEnable", 7, Integer, no,
     about("Whether idle and seized codes are sent").oneOf(kTruthValues)},
    {"dsx0Ds0BundleMappedIfIndex", 8, Integer, bundle,
     about("The bundle that the channel is part of")},
};

constexpr Column<Ds0ChannelRow> kMappingColumns[] = {
    {"dsx0ChanMappedIfIndex", 1, Integer, channel, about("The interface that is the channel")},
};

} // namespace

Table const& dsx0ConfigTable() {
    static RowTable<BearerRow, interfaceRows<&InterfaceRows::bearers>> const table(
        "dsx0ConfigTable", {10, 81, 1, 1}, kConfigColumns);
    return table;
}

Table const& dsx0ChanMappingTable() {
    static RowTable<Ds0ChannelRow, interfaceRows<&InterfaceRows::ds0Channels>> const table(
        "dsx0ChanMappingTable", {10, 81, 3, 1}, kMappingColumns);
    return table;
}

} // namespace kvloamd
