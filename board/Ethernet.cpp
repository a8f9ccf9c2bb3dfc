// SPDX-License-Identifier: BSD-2-Clause
#include "board/Ethernet.h"

namespace KVL {

Ethernet::Ethernet() {
    answer_to(iid());
}

Ethernet::~Ethernet() = default;

} // namespace KVL
