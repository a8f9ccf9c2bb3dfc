// SPDX-License-Identifier: BSD-2-Clause
// The clocks by which the agent measures times of its own and reads dates.
#pragma once

#include <chrono>
#include <functional>

namespace kvloamd {

/// Steps of the time of day do not move it.
using Clock = std::chrono::steady_clock;

/// The host's two clocks. Tests put others in their place.
struct Clocks {
    std::function<Clock::time_point()> now = &Clock::now;
    /// The time of day, since the epoch.
    std::function<std::chrono::milliseconds()> date = &dateOfHost;

    static std::chrono::milliseconds dateOfHost() {
        return std::chrono::duration_cast<std::chrono::milliseconds>(
            std::chrono::system_clock::now().time_since_epoch());
    }
};

} // namespace kvloamd
