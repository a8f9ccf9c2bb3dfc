// SPDX-License-Identifier: BSD-2-Clause
// A feature that holds Ethernet interfaces.
#pragma once

#include "board/Ethernet.h"
#include "board/Feature.h"
#include "core/ReferenceCounter.h"

namespace KVL {

/// An `EthernetFeature` holds a board's Ethernet interfaces. The concrete feature says which
/// threads may walk them.
class KVLOAM_API EthernetFeature : public Feature {
  public:
    EthernetFeature();
    ~EthernetFeature() override;

    virtual ReferenceCounter<Ethernet> GetFirstEthernet() = 0;
    /// The interface after `previous`; an empty handle if there is none.
    virtual ReferenceCounter<Ethernet> GetNextEthernet(ReferenceCounter<Ethernet> previous) = 0;

    static IID iid() { return IID("N3KVL15EthernetFeatureE"); }
};

} // namespace KVL
