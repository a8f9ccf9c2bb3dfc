// SPDX-License-Identifier: BSD-2-Clause
// What ISDN channels may say about calls and about the data link.
#pragma once

#include <cstdint>

#include "platform/Export.h"

/// The call of a bearer channel, or its last call, as ISDN-MIB's isdnBearerTable (RFC 2127) has it.
/// Texts are terminated; dates are seconds since the epoch, 0 for none.
struct ISDNCallDetails {
    char peerAddress[64] = "";
    char peerSubAddress[64] = "";
    int origin = 1;          ///< isdnBearerCallOrigin; 1 unknown
    int informationType = 1; ///< isdnBearerInfoType; 1 unknown
    int multirate = 2;       ///< 1 true, 2 false
    std::uint32_t chargedUnits = 0;
    long setupTime = 0;
    long connectTime = 0; ///< 0 for a call that was never connected
};

/// An `ISDNCallChannel` is a bearer channel that knows its calls. A class derived from
/// `ISDNBChannel` may derive from this class too; agents find it by a dynamic cast of the channel.
/// It has no interface identifier and no reference count of its own.
class KVLOAM_API ISDNCallChannel {
  public:
    /// Thread-safe.
    virtual ISDNCallDetails GetCall() = 0;

  protected:
    ISDNCallChannel() = default;
    ISDNCallChannel(ISDNCallChannel const&) = default;
    ISDNCallChannel& operator=(ISDNCallChannel const&) = default;
    ~ISDNCallChannel() = default;
};

/// What a signalling channel has counted, as isdnSignalingStatsTable and isdnLapdTable have it.
struct ISDNSignallingCounts {
    std::uint32_t inCalls = 0;
    std::uint32_t inConnected = 0;
    std::uint32_t outCalls = 0;
    std::uint32_t outConnected = 0;
    std::uint32_t chargedUnits = 0;
    std::uint32_t peerSabme = 0;
    std::uint32_t recvdFrmr = 0;
};

/// An `ISDNCountingChannel` is a signalling channel that counts calls and frames. A class derived
/// from `ISDNDChannel` may derive from this class too, as with `ISDNCallChannel`.
class KVLOAM_API ISDNCountingChannel {
  public:
    /// Returns 0, or another number when the counts are not known. Thread-safe.
    virtual int GetCounts(ISDNSignallingCounts& counts) = 0;
    /// Writes the terminated subaddress of the calling address, at most 63 characters. Returns 0.
    /// Thread-safe.
    virtual int GetCallingSubAddress(char* address) = 0;

  protected:
    ISDNCountingChannel() = default;
    ISDNCountingChannel(ISDNCountingChannel const&) = default;
    ISDNCountingChannel& operator=(ISDNCountingChannel const&) = default;
    ~ISDNCountingChannel() = default;
};
