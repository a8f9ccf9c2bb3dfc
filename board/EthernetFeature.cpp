// SPDX-License-Identifier: BSD-2-Clause
#include "board/EthernetFeature.h"

namespace KVL {

EthernetFeature::EthernetFeature() {
    interfaces()->add(iid());
}

EthernetFeature::~EthernetFeature() = default;

} // namespace KVL
