// SPDX-License-Identifier: BSD-2-Clause
// A board module that fails in its entry point.
#include <stdexcept>

#include "board/BoardModule.h"

extern "C" BoardFactory* kvl_create_board_factory(int) {
    throw std::runtime_error("out of boards");
}
