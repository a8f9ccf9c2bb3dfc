// SPDX-License-Identifier: BSD-2-Clause
// The board platform's ISDN channels: the attributes of a trunk, and the announced changes.
#pragma once

#include <cstddef>
#include <cstdint>

/// Attributes of a device with ISDN channels.
/// One byte per bearer channel, an `ISDNBearerState` each, in the order of the channels.
inline constexpr char const* kISDNChannelStates = "CHANNEL_STATES";
/// An `ISDNSignallingState`, in 4 bytes.
inline constexpr char const* kISDNSignallingState = "SIGNALLING_STATE";

/// What the trunk calls itself in calls: texts, absent when it has none.
inline constexpr char const* kISDNCallingAddress = "CALLING_ADDRESS";
inline constexpr char const* kISDNCallingSubAddress = "CALLING_SUBADDRESS";
/// One `ISDNCallRecord` per bearer channel, in the order of the channels.
inline constexpr char const* kISDNCallRecords = "CALL_RECORDS";
/// One `ISDNSignallingCounters`.
inline constexpr char const* kISDNSignallingCounters = "SIGNALLING_COUNTERS";
/// An `ISDNProtocol`, in 1 byte.
inline constexpr char const* kISDNProtocol = "Protocol_Type_0";

/// The signalling protocols of trunks. There are others, which the platform does not name.
enum class ISDNProtocol : std::int8_t {
    national2 = 1,
    ess4 = 2,
    dms100 = 3,
    etsi = 4,
    qsig = 5,
    ins1500 = 6,
};

enum class ISDNBearerState : std::uint8_t {
    idle = 1,
    connecting = 2,
    connected = 3,
    active = 4,
};

enum class ISDNSignallingState : std::int32_t {
    inactive = 1,
    layer1Active = 2,
    layer2Active = 3,
};

/// An `ISDNCallRecord` is the call of a bearer channel, or its last call. The texts are terminated
/// by a NUL; times are seconds since the epoch, 0 for none. The numbers of `origin` and
/// `information` are those of isdnBearerCallOrigin and isdnBearerInfoType.
struct ISDNCallRecord {
    char peer[32];
    char peerSubAddress[24];
    std::int32_t origin;
    std::int32_t information;
    std::int32_t multirate; ///< 1: yes
    std::uint32_t chargedUnits;
    std::uint32_t setupTime;
    std::uint32_t connectTime;
};

static_assert(sizeof(ISDNCallRecord) == 80 && alignof(ISDNCallRecord) == 4);

/// What a signalling channel has counted since it was loaded, modulo 2^32.
struct ISDNSignallingCounters {
    std::uint32_t inCalls;
    std::uint32_t inConnected;
    std::uint32_t outCalls;
    std::uint32_t outConnected;
    std::uint32_t chargedUnits;
    std::uint32_t peerSabme; ///< SABME frames from the peer: it established the data link
    std::uint32_t recvdFrmr; ///< FRMR frames from the peer: it rejected a frame
};

static_assert(sizeof(ISDNSignallingCounters) == 28 && alignof(ISDNSignallingCounters) == 4);

/// Messages of the channel "ADMIN", each with an ISDNChannelMsg.
/// Of a bearer channel: its state or its call record has changed.
inline constexpr std::uint32_t kISDNBearerChanged = 0x50001;
inline constexpr std::uint32_t kISDNSignallingChanged = 0x50002;

/// An `ISDNChannelMsg` is the new state of a channel. The layout is the platform's; words are
/// little-endian.
struct ISDNChannelMsg {
    std::int32_t board;   ///< handle
    std::int32_t device;  ///< handle
    std::int32_t channel; ///< from 1 in the order of CHANNEL_STATES; 0: the signalling channel
    std::int32_t state;   ///< an ISDNBearerState, or for channel 0 an ISDNSignallingState
};

static_assert(sizeof(ISDNChannelMsg) == 16 && alignof(ISDNChannelMsg) == 4);
static_assert(offsetof(ISDNChannelMsg, device) == 4);
static_assert(offsetof(ISDNChannelMsg, channel) == 8);
static_assert(offsetof(ISDNChannelMsg, state) == 12);
