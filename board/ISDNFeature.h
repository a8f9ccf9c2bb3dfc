// SPDX-License-Identifier: BSD-2-Clause
// The abstract set of a board's ISDN channels.
#pragma once

#include "board/Feature.h"
#include "board/ISDNChannel.h"

/// An `ISDNFeature` holds a board's bearer and signalling channels. The concrete feature says which
/// threads may walk them.
class KVLOAM_API ISDNFeature : public Feature {
  public:
    ISDNFeature();
    ~ISDNFeature() override;

    /// Adds a listener for all channels. It is not owned.
    virtual int AddISDNStatusListener(ISDNChannelStatusListener* listener) = 0;

    // A walk ends with an empty handle. The argument of `GetFirstChannel` only selects the kind of
    // channel.
    virtual ReferenceCounter<ISDNBChannel> GetFirstChannel(ReferenceCounter<ISDNBChannel> kind) = 0;
    virtual ReferenceCounter<ISDNBChannel> GetFirstBChannel();
    virtual ReferenceCounter<ISDNBChannel>
    GetNextChannel(ReferenceCounter<ISDNBChannel> previous) = 0;
    virtual ReferenceCounter<ISDNBChannel> GetNextBChannel(ReferenceCounter<ISDNBChannel> previous);
    virtual ReferenceCounter<ISDNDChannel> GetFirstChannel(ReferenceCounter<ISDNDChannel> kind) = 0;
    virtual ReferenceCounter<ISDNDChannel> GetFirstDChannel();
    virtual ReferenceCounter<ISDNDChannel>
    GetNextChannel(ReferenceCounter<ISDNDChannel> previous) = 0;
    virtual ReferenceCounter<ISDNDChannel> GetNextDChannel(ReferenceCounter<ISDNDChannel> previous);

    /// The first bearer channel with this name, or an empty handle.
    ReferenceCounter<ISDNBChannel> FindBChannel(char const* name);

    static KVL::IID iid() { return KVL::IID("11ISDNFeature"); }
};
