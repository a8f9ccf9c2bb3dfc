// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/Courtesy.h"

#include <chrono>
#include <thread>

#include "agent/rows/Clock.h"

namespace kvloamd {

namespace {

/// The time between two yields: short enough for requests, long enough for a busy processor.
constexpr std::chrono::microseconds kTurn{1000};

} // namespace

void yieldBetweenBoards() {
    static thread_local Clock::time_point last;
    if (Clock::now() - last < kTurn) return;
    std::this_thread::yield();
    last = Clock::now();
}

} // namespace kvloamd
