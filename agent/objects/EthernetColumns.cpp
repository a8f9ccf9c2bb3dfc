// SPDX-License-Identifier: BSD-2-Clause
// EtherLike-MIB's tables: what Ethernet interfaces count of their own, and their flow control.
#include "agent/objects/RowValues.h"
#include "agent/objects/StandardObjects.h"
#include "agent/rows/StandardNumbers.h"

namespace kvloamd {

namespace {

// dot3StatsDuplexStatus's and dot3StatsRateControlStatus's.
constexpr int kUnknownDuplex = 1;
constexpr std::int64_t kRateControlOff = 1;
constexpr std::int64_t kUnknownRateControl = 3;

/// Slower interfaces have no rate control, bit/s.
constexpr std::uint32_t kLeastSpeedOfRateControl = 1'000'000'001;

Value index(EthernetRow const& row) {
    return std::int64_t{row.ifIndex};
}

Value duplexStatus(EthernetRow const& row) {
    return std::int64_t{row.duplexStatus.value_or(kUnknownDuplex)};
}

bool hasNoRateControl(EthernetRow const& row) {
    return row.speed && *row.speed < kLeastSpeedOfRateControl;
}

Value rateControlAbility(EthernetRow const& row) {
    return hasNoRateControl(row) ? Value{std::int64_t{kFalse}} : Value{};
}

Value rateControlStatus(EthernetRow const& row) {
    return hasNoRateControl(row) ? kRateControlOff : kUnknownRateControl;
}

using enum ValueType;
using Row = EthernetRow;

constexpr NamedNumber kDot3StatsDuplexStatus[] = {
    {1, "unknown"}, {2, "halfDuplex"}, {3, "fullDuplex"}};

constexpr NamedNumber kTruth[] = {{1, "true"}, {2, "false"}};

constexpr NamedNumber kRateControl[] = {
    {1, "rateControlOff"}, {2, "rateControlOn"}, {3, "unknown"}};

constexpr NamedNumber kPauseModes[] = {
    {1, "disabled"}, {2, "enabledXmit"}, {3, "enabledRcv"}, {4, "enabledXmitAndRcv"}};

constexpr Column<Row> kColumns[] = {
    {"dot3StatsIndex", 1, Integer, index, about("The interface")},
    {"dot3StatsAlignmentErrors", 2, Counter, count32<kAlignmentErrors>,
     about("Frames received with a wrong checksum and a broken last octet")},
    {"dot3StatsFCSErrors", 3, Counter, count32<kFcsErrors>,
     about("Frames received with a wrong checksum and whole octets")},
    {"dot3StatsSingleCollisionFrames", 4, Counter, count32<kSingleCollisionFrames>,
     about("Frames sent after one collision")},
    {"dot3StatsMultipleCollisionFrames", 5, Counter, count32<kMultipleCollisionFrames>,
     about("Frames sent after several collisions")},
    {"dot3StatsSQETestErrors", 6, Counter, count32<kSqeTestErrors>,
     about("Failed tests of the collision signal")},
    {"dot3StatsDeferredTransmissions", 7, Counter, count32<kDeferredTransmissions>,
     about("Frames whose first attempt had to wait for the medium")},
    {"dot3StatsLateCollisions", 8, Counter, count32<kLateCollisions>,
     about("Collisions later than the medium permits")},
    {"dot3StatsExcessiveCollisions", 9, Counter, count32<kExcessiveCollisions>,
     about("Frames given up after too many collisions")},
    {"dot3StatsInternalMacTransmitErrors", 10, Counter, count32<kInternalMacTransmitErrors>,
     about("Frames not sent because of a fault of the controller")},
    {"dot3StatsCarrierSenseErrors", 11, Counter, count32<kCarrierSenseErrors>,
     about("Frames during which the carrier was lost or never there")},
    {"dot3StatsFrameTooLongs", 13, Counter, count32<kFrameTooLongs>,
     about("Frames received that are longer than permitted")},
    {"dot3StatsInternalMacReceiveErrors", 16, Counter, count32<kInternalMacReceiveErrors>,
     about("Frames lost in reception because of a fault of the controller")},
    {"dot3StatsSymbolErrors", 18, Counter, count32<kSymbolErrors>,
     about("Symbols received that are not valid")},
    {"dot3StatsDuplexStatus", 19, Integer, duplexStatus,
     about("Whether the interface sends and receives at the same time")
         .oneOf(kDot3StatsDuplexStatus)},
    {"dot3StatsRateControlAbility", 20, Integer, rateControlAbility,
     about("Whether the interface can slow down to the rate of its medium").oneOf(kTruth)},
    {"dot3StatsRateControlStatus", 21, Integer, rateControlStatus,
     about("Whether the interface slows down to the rate of its medium").oneOf(kRateControl)},
};

constexpr Column<Row> kPauseColumns[] = {
    {"dot3PauseAdminMode", 1, Integer, number<&Row::pauseAdminMode>,
     about("What the interface is meant to do with pause frames").oneOf(kPauseModes)},
    {"dot3PauseOperMode", 2, Integer, number<&Row::pauseOperMode>,
     about("What the interface does with pause frames").oneOf(kPauseModes)},
    {"dot3InPauseFrames", 3, Counter, count32<kInPauseFrames>, about("Pause frames received")},
    {"dot3OutPauseFrames", 4, Counter, count32<kOutPauseFrames>, about("Pause frames sent")},
    {"dot3HCInPauseFrames", 5, Counter64, count64<kInPauseFrames>,
     about("As dot3InPauseFrames, with 64 bits")},
    {"dot3HCOutPauseFrames", 6, Counter64, count64<kOutPauseFrames>,
     about("As dot3OutPauseFrames, with 64 bits")},
};

constexpr Column<Row> kLongColumns[] = {
    {"dot3HCStatsAlignmentErrors", 1, Counter64, count64<kAlignmentErrors>,
     about("As dot3StatsAlignmentErrors, with 64 bits")},
    {"dot3HCStatsFCSErrors", 2, Counter64, count64<kFcsErrors>,
     about("As dot3StatsFCSErrors, with 64 bits")},
    {"dot3HCStatsInternalMacTransmitErrors", 3, Counter64, count64<kInternalMacTransmitErrors>,
     about("As dot3StatsInternalMacTransmitErrors, with 64 bits")},
    {"dot3HCStatsFrameTooLongs", 4, Counter64, count64<kFrameTooLongs>,
     about("As dot3StatsFrameTooLongs, with 64 bits")},
    {"dot3HCStatsInternalMacReceiveErrors", 5, Counter64, count64<kInternalMacReceiveErrors>,
     about("As dot3StatsInternalMacReceiveErrors, with 64 bits")},
    {"dot3HCStatsSymbolErrors", 6, Counter64, count64<kSymbolErrors>,
     about("As dot3StatsSymbolErrors, with 64 bits")},
};

} // namespace

Table const& dot3StatsTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::ethernets>> const table(
        "dot3StatsTable", {10, 7, 2, 1}, kColumns);
    return table;
}

Table const& dot3PauseTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::ethernets>> const table(
        "dot3PauseTable", {10, 7, 10, 1}, kPauseColumns);
    return table;
}

Table const& dot3HCStatsTable() {
    static RowTable<Row, interfaceRows<&InterfaceRows::ethernets>> const table(
        "dot3HCStatsTable", {10, 7, 11, 1}, kLongColumns);
    return table;
}

} // namespace kvloamd
