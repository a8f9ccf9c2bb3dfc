// SPDX-License-Identifier: BSD-2-Clause
// What a board offers beyond its own queries, made from what the device mapper lists under it.
#pragma once

#include <vector>

#include "LineRecords.h"
#include "board/Feature.h"
#include "core/ReferenceCounter.h"

/// `board`: the board's handle in the device mapper.
using FeatureList = std::vector<ReferenceCounter<Feature>>;

/// The features of the board's lines, channels and devices; each is complete and not changed any
/// more. A kind of which the board has none makes no feature. `records`: of the board's lines.
FeatureList makeExtendedFeatures(long board, LineRecords& records);

/// The features of the board's Ethernet and IP interfaces.
FeatureList makeNetworkFeatures(long board);
