// SPDX-License-Identifier: BSD-2-Clause
// The devices of a board.
#pragma once

#include <vector>

#include "Z7SimISDNFeature.h"
#include "Z7SimLineFeature.h"
#include "z7/Z7ResourceFeature.h"

/// All devices of the board that are of a kind, in the order of the device mapper. Devices of each
/// kind are numbered from 1, and so are the lines of all trunks together. Nothing changes after the
/// constructor but what a trunk tells of its line and its signalling channel.
class Z7SimResourceFeature final : public Z7ResourceFeature {
  public:
    /// `lines`, `isdn`: where the trunks find their lines and signalling channels; may be empty.
    Z7SimResourceFeature(long board, std::vector<long> const& devices,
                         ReferenceCounter<Z7SimLineFeature> const& lines,
                         ReferenceCounter<Z7SimISDNFeature> const& isdn);
    ~Z7SimResourceFeature() override;

    int GetNumberOfDevices() override;
};

/// The feature of those among `devices` that are of a kind; an empty handle when none is.
ReferenceCounter<Z7SimResourceFeature>
makeResourceFeature(long board, std::vector<long> const& devices,
                    ReferenceCounter<Z7SimLineFeature> const& lines,
                    ReferenceCounter<Z7SimISDNFeature> const& isdn);
