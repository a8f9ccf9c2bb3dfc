// SPDX-License-Identifier: BSD-2-Clause
// The Ethernet interface of a board.
#pragma once

#include <optional>

#include "HostDevice.h"
#include "board/EthernetFeature.h"

/// A `Z7SimEthernetFeature` holds the Ethernet interface of a board.
class Z7SimEthernetFeature final : public KVL::EthernetFeature {
  public:
    explicit Z7SimEthernetFeature(ReferenceCounter<KVL::Ethernet> ethernet);
    ~Z7SimEthernetFeature() override;

    ReferenceCounter<KVL::Ethernet> GetFirstEthernet() override { return m_ethernet; }
    ReferenceCounter<KVL::Ethernet>
    GetNextEthernet(ReferenceCounter<KVL::Ethernet> previous) override;

  private:
    ReferenceCounter<KVL::Ethernet> const m_ethernet;
};

/// The device of this host that represents the board's Ethernet interface, if the board names one.
/// An invalid name is reported on standard error and ignored.
std::optional<HostDevice> readHostDevice(long board);

/// The board's Ethernet interface: `host` if there is one, else the simulated one that the board
/// describes; an empty handle when it describes none.
ReferenceCounter<KVL::EthernetFeature> makeEthernetFeature(long board,
                                                           std::optional<HostDevice> const& host);
