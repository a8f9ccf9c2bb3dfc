// SPDX-License-Identifier: BSD-2-Clause
// The resources of a Z7 board.
#pragma once

#include <vector>

#include "board/Feature.h"
#include "core/ReferenceCounter.h"
#include "z7/Z7Device.h"

/// Lists a board's devices. The concrete feature fills the list before it publishes itself and
/// leaves it alone afterwards; any thread may then walk it.
class KVLOAM_API Z7ResourceFeature : public Feature {
  public:
    Z7ResourceFeature();
    ~Z7ResourceFeature() override;

    virtual int GetNumberOfDevices() = 0;

    ReferenceCounter<Z7Device> GetFirstDevice();
    /// An empty handle when `current` is the last device or none of this feature.
    ReferenceCounter<Z7Device> GetNextDevice(ReferenceCounter<Z7Device> current);
    /// Deliberate: answers an empty handle for every name. Devices are walked.
    ReferenceCounter<Z7Device> GetDevice(char* name);

    static KVL::IID iid() { return KVL::IID("17Z7ResourceFeature"); }

  protected:
    std::vector<ReferenceCounter<Z7Device>> m_devices;
};
