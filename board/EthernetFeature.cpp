// SPDX-License-Identifier: BSD-2-Clause
#include "board/EthernetFeature.h"

namespace KVL {

EthernetFeature::EthernetFeature() {
    answer_to(iid());
}

EthernetFeature::~EthernetFeature() = default;

} // namespace KVL
