// SPDX-License-Identifier: BSD-2-Clause
// A feature that holds network interfaces.
#pragma once

#include "board/Feature.h"
#include "board/Interface.h"
#include "core/ReferenceCounter.h"

namespace KVL {

/// An `InterfaceFeature` holds network interfaces of a board. The concrete feature says which
/// threads may walk them.
class KVLOAM_API InterfaceFeature : public Feature {
  public:
    InterfaceFeature();
    ~InterfaceFeature() override;

    virtual ReferenceCounter<Interface> GetFirstInterface() = 0;
    /// The interface after `previous`; an empty handle if there is none.
    virtual ReferenceCounter<Interface> GetNextInterface(ReferenceCounter<Interface> previous) = 0;

    static IID iid() { return IID("N3KVL16InterfaceFeatureE"); }
};

} // namespace KVL
