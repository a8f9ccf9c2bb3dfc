// SPDX-License-Identifier: BSD-2-Clause
// The ISDN channels of a board.
#pragma once

#include <vector>

#include "ISDNMonitor.h"
#include "Withdrawable.h"
#include "Z7SimISDNChannels.h"
#include "Z7SimLineFeature.h"
#include "boardplatform/isdn_channels.h"
#include "z7/ISDNFeatureZ7.h"

/// A `Z7SimISDNFeature` holds the channels of every device that has a bearer and a signalling
/// state. Such trunks are numbered from 1 in the order of the device mapper; their channels are
/// called "B<trunk>.<time slot>" and "D<trunk>".
///
/// Status changes are announced on the platform's delivery thread: to the feature's listeners, then
/// to the channel's own.
class Z7SimISDNFeature final : public ISDNFeatureZ7,
                               public Withdrawable,
                               public ISDNMessageReceiver {
  public:
    /// Asks `devices` of the board for their channels, and `lines`, which may be empty, for the
    /// lines that carry them. The channels' states are not known before `readStates`.
    Z7SimISDNFeature(long board, std::vector<long> const& devices,
                     ReferenceCounter<Z7SimLineFeature> const& lines);
    ~Z7SimISDNFeature() override;

    /// Asks the platform for the state of every channel. Follow the messages first: a change is
    /// then either read or announced.
    void readStates();
    /// Applies a message, and announces it when it is a change.
    void apply(std::uint32_t id, ISDNChannelMsg const& message) override;
    /// No message that comes from now on reaches the feature; one under way on another thread may.
    void Withdraw() override;

    /// The devices that are trunks.
    std::vector<long> trunks() const;
    /// The signalling channel of `device`; an empty handle when it is no trunk.
    ReferenceCounter<ISDNDChannel> signallingChannel(long device) const;

  private:
    struct Trunk {
        long device;
        std::vector<ReferenceCounter<Z7SimBChannel>> bearers;
        ReferenceCounter<Z7SimDChannel> signalling;
    };

    void addTrunk(long board, long device, int bearers,
                  ReferenceCounter<DS1LineDevice> const& line);
    Trunk const* find(long device) const;
    static void readCalls(Trunk const& trunk);
    void applyToBearer(Trunk const& trunk, ISDNChannelMsg const& message);
    void applyToSignalling(Trunk const& trunk, ISDNChannelMsg const& message);

    std::vector<Trunk> m_trunks; ///< not changed after the constructor
};

/// The feature of the board's trunks among `devices`, which follows the platform until it is
/// withdrawn; an empty handle when there is no trunk.
ReferenceCounter<Z7SimISDNFeature> makeISDNFeature(long board, std::vector<long> const& devices,
                                                   ReferenceCounter<Z7SimLineFeature> const& lines);
