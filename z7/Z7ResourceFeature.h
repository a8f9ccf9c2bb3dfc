// SPDX-License-Identifier: BSD-2-Clause
// The devices of a Z7 board.
#pragma once

#include <vector>

#include "board/Feature.h"
#include "core/ReferenceCounter.h"
#include "z7/Z7Device.h"

/// A `Z7ResourceFeature` holds a board's devices. The concrete feature fills the list before other
/// threads see the feature and does not change it afterwards. Thread-safe from then on.
class KVLOAM_API Z7ResourceFeature : public Feature {
  public:
    Z7ResourceFeature();
    ~Z7ResourceFeature() override;

    virtual int GetNumberOfDevices() = 0;

    ReferenceCounter<Z7Device> GetFirstDevice();
    /// The device after `current`; an empty handle if `current` is the last device or is not one of
    /// this feature.
    ReferenceCounter<Z7Device> GetNextDevice(ReferenceCounter<Z7Device> current);
    /// Deliberate: returns an empty handle for every name. Devices are found by a walk.
    ReferenceCounter<Z7Device> GetDevice(char* name);

    static KVL::IID iid() { return KVL::IID("17Z7ResourceFeature"); }

  protected:
    std::vector<ReferenceCounter<Z7Device>> m_devices;
};
