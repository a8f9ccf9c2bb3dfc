// SPDX-License-Identifier: BSD-2-Clause
#include "BoardFeatures.h"

#include "Z7SimLineFeature.h"

FeatureList makeExtendedFeatures(long board) {
    FeatureList features;
    ReferenceCounter<Z7SimLineFeature> const lines = Z7SimLineFeature::make(board);
    if (lines.get() != nullptr) features.emplace_back(lines.get());
    return features;
}

FeatureList makeNetworkFeatures(long /*board*/) {
    return {};
}
