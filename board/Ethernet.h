// SPDX-License-Identifier: BSD-2-Clause
// The abstract Ethernet interface.
#pragma once

#include "board/Interface.h"

namespace KVL {

/// An `Ethernet` is an Ethernet interface: the interface queries, then the statistics of
/// EtherLike-MIB's dot3StatsTable (RFC 3635). A statistic that is not supported is `kNotSupported`.
class KVLOAM_API Ethernet : public Interface {
  public:
    Ethernet();
    ~Ethernet() override;

    virtual int GetAlignmentErrors() = 0;
    virtual int GetFCSErrors() = 0;
    virtual int GetSingleCollisionFrames() = 0;
    virtual int GetMultipleCollisionFrames() = 0;
    virtual int GetSQETestErrors() = 0;
    virtual int GetDeferredTransmissions() = 0;
    virtual int GetLateCollisions() = 0;
    virtual int GetExcessiveCollisions() = 0;
    virtual int GetInternalMacTransmitErrors() = 0;
    virtual int GetCarrierSenseErrors() = 0;
    virtual int GetFrameTooLongs() = 0;
    virtual int GetInternalMacReceiveErrors() = 0;
    virtual int GetSymbolErrors() = 0;
    virtual int GetDuplexStatus() = 0;

    static IID iid() { return IID("N3KVL8EthernetE"); }
};

} // namespace KVL
