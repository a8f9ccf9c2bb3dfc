// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a Z7 board.
#pragma once

#include <vector>

#include "board/ISDNFeature.h"
#include "core/ListenerTable.h"

/// Keeps the channels in two vectors, which the board module fills before it publishes the feature
/// and leaves alone afterwards; any thread may then walk them. Listeners are kept and walked under
/// the feature's own lock.
class KVLOAM_API ISDNFeatureZ7 : public ISDNFeature {
  public:
    ISDNFeatureZ7();
    ~ISDNFeatureZ7() override;

    /// Returns 0, also for a listener that was added before.
    int AddISDNStatusListener(ISDNChannelStatusListener* listener) override;
    ReferenceCounter<ISDNBChannel> GetFirstChannel(ReferenceCounter<ISDNBChannel> kind) override;
    ReferenceCounter<ISDNBChannel> GetNextChannel(ReferenceCounter<ISDNBChannel> previous) override;
    ReferenceCounter<ISDNDChannel> GetFirstChannel(ReferenceCounter<ISDNDChannel> kind) override;
    ReferenceCounter<ISDNDChannel> GetNextChannel(ReferenceCounter<ISDNDChannel> previous) override;

    /// The first channel of that name, or an empty handle. The name is only read.
    virtual ReferenceCounter<ISDNBChannel> GetBChannel(char* name);
    /// Deliberate: goes past all channels and answers an empty handle for every index. Channels are
    /// found by name, or walked.
    virtual ReferenceCounter<ISDNBChannel> GetBChannel(long index);
    /// As for bearer channels.
    virtual ReferenceCounter<ISDNDChannel> GetDChannel(char* name);
    virtual ReferenceCounter<ISDNDChannel> GetDChannel(long index);

    /// Each hands one event of `channel` to the feature's listeners, on the caller's thread.
    /// Returns 0. The listeners of the channel itself are the channel's to notify.
    virtual int NotifyBChannelStatusListeners(ReferenceCounter<ISDNBChannel> channel,
                                              ISDNBChannelStatusEnum status);
    virtual int NotifyDChannelStatusListeners(ReferenceCounter<ISDNDChannel> channel,
                                              ISDNDChannelStatusEnum status);

  protected:
    std::vector<ReferenceCounter<ISDNBChannel>> m_bearerChannels;
    std::vector<ReferenceCounter<ISDNDChannel>> m_signallingChannels;
    ListenerTable m_listeners;
};
