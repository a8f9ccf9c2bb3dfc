// SPDX-License-Identifier: BSD-2-Clause
// The boards' lines, channels and interfaces as the agent serves them.
#pragma once

#include <array>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "agent/rows/ClosedIntervals.h"
#include "agent/rows/IndexKey.h"
#include "agent/rows/Rows.h"

namespace kvloamd {

/// IF-MIB's ifOperStatus; the first three are ifAdminStatus's too.
enum InterfaceStatus : int {
    kUp = 1,
    kDown = 2,
    kTesting = 3,
    kUnknownStatus = 4,
    kDormant = 5,
    kNotPresent = 6,
    kLowerLayerDown = 7
};

/// Whether a link in this state is down for linkDown and linkUp.
constexpr bool isDown(int operStatus) {
    return operStatus == kDown || operStatus == kLowerLayerDown;
}

/// Values of ifType.
enum InterfaceType : int {
    kTypeEthernet = 6,
    kTypeDs1 = 18,
    kTypeLoopback = 24,
    kTypeVirtual = 53, ///< propVirtual
    kTypeIsdn = 63,
    kTypeLapd = 77,
    kTypeDs0 = 81
};

/// The counters of an interface, in the order of IF-MIB's ifTable and ifXTable.
enum InterfaceCounter : std::size_t {
    kInOctets,
    kInUcastPkts,
    kInDiscards,
    kInErrors,
    kInUnknownProtos,
    kOutOctets,
    kOutUcastPkts,
    kOutDiscards,
    kOutErrors,
    kInMulticastPkts,
    kInBroadcastPkts,
    kOutMulticastPkts,
    kOutBroadcastPkts,
    kInterfaceCounters ///< how many
};

/// The low 32 bits are the interface's own; the rest counts how often they have wrapped.
template <std::size_t Counters>
using LongCounts = std::array<std::optional<std::uint64_t>, Counters>;

/// What ifSpeed is for an interface that is as fast or faster.
inline constexpr std::uint32_t kMostSpeed = 0xffffffff;

/// Texts are empty and numbers none when they are not known. Every kind of interface has a row of
/// this one; what only its kind has is in another, of the same index.
struct InterfaceRow {
    std::uint32_t ifIndex = 0;
    std::uint32_t boardIndex = 0;
    std::string description;
    std::string name;
    std::optional<int> type;
    std::optional<int> mtu;
    std::optional<std::uint32_t> speed;     ///< bit/s; `kMostSpeed`: that or more
    std::optional<std::uint32_t> highSpeed; ///< Mbit/s, if it is not the rounded `speed`
    std::string physAddress;
    std::optional<int> adminStatus;
    std::optional<int> operStatus;
    std::optional<std::uint32_t> lastChange; ///< hundredths of a second since the agent's start
    LongCounts<kInterfaceCounters> counters;
    /// Since when the counters have counted on, as `lastChange`; 0: since the agent's start.
    std::uint32_t discontinuity = 0;
    std::optional<int> promiscuousMode;  ///< 1: yes, 2: no
    std::optional<int> connectorPresent; ///< the same
    /// The default of ifLinkUpDownTrapEnable: 1 enabled, 2 disabled.
    int linkUpDownTraps = 1;
    std::string boardSerialNumber;

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(InterfaceRow const&) const = default;
};

/// One interface above another; 0 is none.
struct StackRow {
    std::uint32_t higher = 0;
    std::uint32_t lower = 0;

    std::array<std::uint32_t, 2> index() const { return {higher, lower}; }
    auto operator<=>(StackRow const&) const = default;
};

/// What a line has counted since the agent saw it first. Never falls; `kUnknownTotal`: not known.
using LineTotals = std::array<std::int64_t, kLineCounters>;
inline constexpr std::int64_t kUnknownTotal = -1;

/// The totals of a line of which nothing is known.
constexpr LineTotals unknownTotals() {
    LineTotals totals{};
    totals.fill(kUnknownTotal);
    return totals;
}

struct LineRow {
    std::uint32_t ifIndex = 0;
    std::optional<int> lineType;
    std::optional<int> lineCoding;
    std::optional<int> sendCode;
    std::string circuitIdentifier;
    std::optional<int> loopbackConfig;
    std::optional<int> lineStatus;
    std::optional<int> signalMode;
    std::optional<int> transmitClockSource;
    std::optional<int> fdl;
    std::optional<int> lineLength;
    std::optional<std::uint32_t> statusLastChange; ///< as `InterfaceRow::lastChange`
    std::optional<int> statusChangeTrapEnable;
    std::optional<int> loopbackStatus;
    std::optional<int> ds1ChannelNumber;
    std::optional<int> channelization;
    std::optional<int> lineMode;
    std::optional<int> lineBuildOut;
    std::optional<int> lineImpedance;

    std::optional<int> timeElapsed;                ///< of the running interval, in seconds
    LineCounts running{};                          ///< good when the line keeps a history
    std::shared_ptr<ClosedIntervals const> closed; ///< none: the line keeps no history
    std::uint64_t history = 0;        ///< a number of the history; a line may get another one
    std::int64_t intervalsClosed = 0; ///< ever, by the history
    /// No second was counted while the history was read, so that its counts fit together.
    bool isWhole = false;
    LineTotals totals = unknownTotals();

    bool keepsHistory() const { return closed != nullptr; }
    /// `interval`: 1 is the newest closed one. Requires that there is such a one.
    bool isValid(std::size_t interval) const { return closed->valid[interval - 1]; }
    std::size_t closedIntervals() const { return keepsHistory() ? closed->counts.size() : 0; }
    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(LineRow const&) const = default; ///< closed intervals that are shared are equal
};

/// A bearer channel's call, or its last one. The defaults are ISDN-MIB's for no call.
struct CallRow {
    std::string peerAddress;
    std::string peerSubAddress;
    int origin = 1;
    int informationType = 1;
    int multirate = 2;
    std::uint32_t setupTime = 0; ///< as `InterfaceRow::lastChange`
    std::uint32_t connectTime = 0;
    std::uint32_t chargedUnits = 0;
    bool connected = false; ///< it was, also if that was before the agent's start

    bool operator==(CallRow const&) const = default;
};

struct BearerRow {
    std::uint32_t ifIndex = 0;
    std::optional<int> channelType;
    std::optional<int> operStatus;
    std::optional<int> channelNumber;           ///< among the bearers of its line, from 1
    std::optional<int> timeSlot = std::nullopt; ///< of its line, from 1
    std::uint32_t signalling = 0;               ///< the ifIndex of what signals for it; 0: unknown
    CallRow call = {};

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(BearerRow const&) const = default;
};

struct SignallingRow {
    std::uint32_t ifIndex = 0;
    std::optional<int> protocol;
    std::string callingAddress;
    std::string callingSubAddress;
    std::optional<int> bearerCount;
    std::optional<std::uint32_t> inCalls;
    std::optional<std::uint32_t> inConnected;
    std::optional<std::uint32_t> outCalls;
    std::optional<std::uint32_t> outConnected;
    std::optional<std::uint32_t> chargedUnits;

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(SignallingRow const&) const = default;
};

/// A time slot of a line and the channel in it.
struct Ds0ChannelRow {
    std::uint32_t line = 0; ///< its ifIndex
    std::uint32_t timeSlot = 0;
    std::uint32_t channel = 0; ///< its ifIndex

    std::array<std::uint32_t, 2> index() const { return {line, timeSlot}; }
    bool operator==(Ds0ChannelRow const&) const = default;
};

/// The data link (LAPD) below a signalling channel.
struct LapdRow {
    std::uint32_t ifIndex = 0;
    std::optional<int> operStatus;
    std::optional<std::uint32_t> peerSabme;
    std::optional<std::uint32_t> recvdFrmr;

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(LapdRow const&) const = default;
};

/// The counters of an Ethernet interface, in the order of EtherLike-MIB's dot3StatsTable.
enum EthernetCounter : std::size_t {
    kAlignmentErrors,
    kFcsErrors,
    kSingleCollisionFrames,
    kMultipleCollisionFrames,
    kSqeTestErrors,
    kDeferredTransmissions,
    kLateCollisions,
    kExcessiveCollisions,
    kInternalMacTransmitErrors,
    kCarrierSenseErrors,
    kFrameTooLongs,
    kInternalMacReceiveErrors,
    kSymbolErrors,
    kInPauseFrames,
    kOutPauseFrames,
    kEthernetCounters ///< how many
};

struct EthernetRow {
    std::uint32_t ifIndex = 0;
    LongCounts<kEthernetCounters> counters;
    std::optional<int> duplexStatus;
    std::optional<int> pauseAdminMode;
    std::optional<int> pauseOperMode;
    std::optional<std::uint32_t> speed; ///< of its interface

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(EthernetRow const&) const = default;
};

/// An address for which an interface receives packets.
struct ReceiveAddressRow {
    std::uint32_t ifIndex = 0;
    std::string address; ///< its octets
    bool isOwn = false;  ///< the interface's own, which it always has

    /// A text in an index begins with its length.
    std::vector<std::uint32_t> index() const {
        std::vector<std::uint32_t> name{ifIndex, static_cast<std::uint32_t>(address.size())};
        for (char const octet : address)
            name.push_back(static_cast<unsigned char>(octet));
        return name;
    }
    bool operator==(ReceiveAddressRow const&) const = default;
};

/// A line or an Ethernet interface: where a board has a cable.
struct PortRow {
    std::uint32_t ifIndex = 0;
    std::uint32_t boardIndex = 0;
    IndexKey key; ///< on its board

    std::array<std::uint32_t, 1> index() const { return {ifIndex}; }
    bool operator==(PortRow const&) const = default;
};

/// The tables of interfaces. `Table`: what holds the rows of one.
template <template <class> class Table>
struct InterfaceTables {
    Table<InterfaceRow> interfaces;
    Table<StackRow> stack;
    Table<LineRow> lines;
    Table<BearerRow> bearers;
    Table<Ds0ChannelRow> ds0Channels; ///< no two in one time slot
    Table<SignallingRow> signalling;
    Table<LapdRow> lapds;
    Table<EthernetRow> ethernets;
    Table<ReceiveAddressRow> receiveAddresses;
    Table<PortRow> ports;

    bool operator==(InterfaceTables const&) const = default;
};

template <class Row>
using RowVector = std::vector<Row>;

/// The tables of one board.
struct BoardInterfaceRows : InterfaceTables<RowVector> {
    bool operator==(BoardInterfaceRows const&) const = default;
};

/// The tables of all boards, ascending by index.
struct InterfaceRows : InterfaceTables<Rows> {
    /// For every line the closed intervals of all lines before it, and at the end those of all.
    std::vector<std::size_t> intervalsBefore{0};
    // When interfaces last came or went: hundredths of a second since the agent's start.
    std::uint32_t lastChange = 0;
    std::uint32_t stackLastChange = 0;
};

/// Counts the intervals before every line of `rows`. To be called when the lines are complete.
inline void countIntervals(InterfaceRows& rows) {
    rows.intervalsBefore.clear();
    rows.intervalsBefore.reserve(rows.lines.size() + 1);
    std::size_t before = 0;
    for (LineRow const& line : rows.lines) {
        rows.intervalsBefore.push_back(before);
        before += line.closedIntervals();
    }
    rows.intervalsBefore.push_back(before);
}

} // namespace kvloamd
