// SPDX-License-Identifier: BSD-2-Clause
// A board module that refuses every version.
#include "board/BoardModule.h"

extern "C" BoardFactory* kvl_create_board_factory(int) {
    return nullptr;
}
