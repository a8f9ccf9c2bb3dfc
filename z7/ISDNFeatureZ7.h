// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a Z7 board.
#pragma once

#include <vector>

#include "board/ISDNFeature.h"
#include "core/ListenerTable.h"

/// An `ISDNFeatureZ7` holds the ISDN channels of a Z7 board. The board module fills the two vectors
/// of channels before other threads see the feature and does not change them afterwards.
/// Thread-safe from then on; the feature's own lock guards the listeners.
class KVLOAM_API ISDNFeatureZ7 : public ISDNFeature {
  public:
    ISDNFeatureZ7();
    ~ISDNFeatureZ7() override;

    /// Returns 0, also if the listener was added before.
    int AddISDNStatusListener(ISDNChannelStatusListener* listener) override;
    ReferenceCounter<ISDNBChannel> GetFirstChannel(ReferenceCounter<ISDNBChannel> kind) override;
    ReferenceCounter<ISDNBChannel> GetNextChannel(ReferenceCounter<ISDNBChannel> previous) override;
    ReferenceCounter<ISDNDChannel> GetFirstChannel(ReferenceCounter<ISDNDChannel> kind) override;
    ReferenceCounter<ISDNDChannel> GetNextChannel(ReferenceCounter<ISDNDChannel> previous) override;

    /// The first channel with this name, or an empty handle. The name is only read.
    virtual ReferenceCounter<ISDNBChannel> GetBChannel(char* name);
    /// Deliberate: returns an empty handle for every index. Channels are found by name or by a
    /// walk.
    virtual ReferenceCounter<ISDNBChannel> GetBChannel(long index);
    /// As for bearer channels.
    virtual ReferenceCounter<ISDNDChannel> GetDChannel(char* name);
    virtual ReferenceCounter<ISDNDChannel> GetDChannel(long index);

    /// Each passes one event of `channel` to the feature's listeners, on the caller's thread, and
    /// returns 0. The channel itself notifies its own listeners.
    virtual int NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel> channel,
                                              ISDNBChannelStatusEnum status);
    virtual int NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel> channel,
                                              ISDNDChannelStatusEnum status);

  protected:
    std::vector<ReferenceCounter<ISDNBChannel>> m_bearerChannels;
    std::vector<ReferenceCounter<ISDNDChannel>> m_signallingChannels;
    ListenerTable m_listeners;
};
