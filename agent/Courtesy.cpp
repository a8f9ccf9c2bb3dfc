// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Courtesy.h"

#include <chrono>
#include <thread>

namespace kvloamd {

namespace {

using Clock = std::chrono::steady_clock;

/// Work between two times: short enough for requests, long enough for a busy processor.
constexpr std::chrono::microseconds kTurn{1000};

} // namespace

void giveWay() {
    static thread_local Clock::time_point last;
    if (Clock::now() - last < kTurn) return;
    std::this_thread::yield();
    last = Clock::now();
}

} // namespace kvloamd
