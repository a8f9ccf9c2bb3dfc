// SPDX-License-Identifier: BSD-2-Clause
#include "BoardFeatures.h"

FeatureList makeExtendedFeatures(long /*board*/) {
    return {};
}

FeatureList makeNetworkFeatures(long /*board*/) {
    return {};
}
