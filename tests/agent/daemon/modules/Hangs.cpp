// SPDX-License-Identifier: BSD-2-Clause
// A board module that never returns from its entry point. It says so on standard error.
#include <unistd.h>

#include <cstdio>

#include "board/BoardModule.h"

extern "C" BoardFactory* kvl_create_board_factory(int) {
    std::fputs("the module hangs\n", stderr);
    for (;;)
        pause();
}
