// SPDX-License-Identifier: BSD-2-Clause
// The devices of a board.
#pragma once

#include <vector>

#include "Z7SimISDNFeature.h"
#include "Z7SimLineFeature.h"
#include "z7/Z7ResourceFeature.h"

/// A `Z7SimResourceFeature` holds the devices of a board whose kind is known, in the order of the
/// device mapper. The devices of each kind are numbered from 1. After construction, only the states
/// of lines and signalling channels change.
class Z7SimResourceFeature final : public Z7ResourceFeature {
  public:
    /// `lines`, `isdn`: where the trunks find their lines and signalling channels; may be empty.
    Z7SimResourceFeature(long board, std::vector<long> const& devices,
                         ReferenceCounter<Z7SimLineFeature> const& lines,
                         ReferenceCounter<Z7SimISDNFeature> const& isdn);
    ~Z7SimResourceFeature() override;

    int GetNumberOfDevices() override;
};

/// The feature of those `devices` whose kind is known; an empty handle when there is none.
ReferenceCounter<Z7SimResourceFeature>
makeResourceFeature(long board, std::vector<long> const& devices,
                    ReferenceCounter<Z7SimLineFeature> const& lines,
                    ReferenceCounter<Z7SimISDNFeature> const& isdn);
