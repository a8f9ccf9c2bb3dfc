// SPDX-License-Identifier: BSD-2-Clause
#include "board/InterfaceFeature.h"

namespace KVL {

InterfaceFeature::InterfaceFeature() {
    answer_to(iid());
}

InterfaceFeature::~InterfaceFeature() = default;

} // namespace KVL
