// SPDX-License-Identifier: BSD-2-Clause
#include "LineClocks.h"

#include <ctime>

namespace {

template <clockid_t clock>
long secondsOf() {
    timespec now{};
    clock_gettime(clock, &now);
    return static_cast<long>(now.tv_sec);
}

} // namespace

LineClocks& LineClocks::inUse() {
    static LineClocks clocks{secondsOf<CLOCK_REALTIME>, secondsOf<CLOCK_MONOTONIC>};
    return clocks;
}
