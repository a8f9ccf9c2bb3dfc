// SPDX-License-Identifier: BSD-2-Clause
// A board module that knows no version that there is.
#include "board/BoardModule.h"

extern "C" BoardFactory* kvl_create_board_factory(int) {
    return nullptr;
}
