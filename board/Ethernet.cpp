// SPDX-License-Identifier: BSD-2-Clause
#include "board/Ethernet.h"

namespace KVL {

Ethernet::Ethernet() {
    interfaces()->add(iid());
}

Ethernet::~Ethernet() = default;

} // namespace KVL
