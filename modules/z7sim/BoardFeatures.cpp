// SPDX-License-Identifier: BSD-2-Clause
#include "BoardFeatures.h"

#include "Z7SimEthernetFeature.h"
#include "Z7SimIPFeature.h"
#include "Z7SimISDNFeature.h"
#include "Z7SimLineFeature.h"
#include "Z7SimResourceFeature.h"
#include "access/DevMapBoardIf.h"

namespace {

/// Appends the feature that `feature` refers to, if there is one.
template <class T>
void append(FeatureList& features, ReferenceCounter<T> const& feature) {
    if (feature.get() != nullptr) features.emplace_back(feature.get());
}

} // namespace

FeatureList makeExtendedFeatures(long board, LineRecords& records) {
    std::vector<long> const devices = DevMapBoardIf(board).ListAllDevices();
    FeatureList features;
    auto const lines = Z7SimLineFeature::make(board, records);
    auto const isdn = makeISDNFeature(board, devices, lines);
    append(features, lines);
    append(features, isdn);
    append(features, makeResourceFeature(board, devices, lines, isdn));
    return features;
}

FeatureList makeNetworkFeatures(long board) {
    std::optional<HostDevice> const host = readHostDevice(board);
    FeatureList features;
    auto const ethernet = makeEthernetFeature(board, host);
    append(features, ethernet);
    append(features, makeIPFeature(board, host, ethernet));
    return features;
}
