// SPDX-License-Identifier: BSD-2-Clause
// The network interfaces of a board: its IP interface.
#pragma once

#include <optional>

#include "HostDevice.h"
#include "board/EthernetFeature.h"
#include "board/InterfaceFeature.h"

/// A `Z7SimIPFeature` holds the IP interface of a board.
class Z7SimIPFeature final : public KVL::InterfaceFeature {
  public:
    explicit Z7SimIPFeature(ReferenceCounter<KVL::Interface> interface);
    ~Z7SimIPFeature() override;

    ReferenceCounter<KVL::Interface> GetFirstInterface() override { return m_interface; }
    ReferenceCounter<KVL::Interface>
    GetNextInterface(ReferenceCounter<KVL::Interface> previous) override;

  private:
    ReferenceCounter<KVL::Interface> const m_interface;
};

/// The board's IP interface over `ethernet`, which may be empty. Its addresses are those that the
/// board describes; when it describes none, those that `host` has now. An empty handle when there
/// are no addresses.
ReferenceCounter<KVL::InterfaceFeature>
makeIPFeature(long board, std::optional<HostDevice> const& host,
              ReferenceCounter<KVL::EthernetFeature> const& ethernet);
