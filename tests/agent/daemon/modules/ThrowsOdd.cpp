// SPDX-License-Identifier: BSD-2-Clause
// A board module that throws an object that is not an exception.
#include "board/BoardModule.h"

extern "C" BoardFactory* kvl_create_board_factory(int) {
    throw 42;
}
