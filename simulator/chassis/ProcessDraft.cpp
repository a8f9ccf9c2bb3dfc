// SPDX-License-Identifier: BSD-2-Clause
// Counters over time.
#include "simulator/chassis/ProcessDraft.h"

#include <algorithm>
#include <cmath>
#include <limits>

namespace kvlsim {

namespace {

enum CounterIndex : std::size_t { queueSize = 2, currentEvents = 3, maxEvents = 4 };

} // namespace

CounterValues Counters::after(double seconds) const {
    constexpr double most = std::numeric_limits<std::int32_t>::max();
    CounterValues values{};
    for (std::size_t i = 0; i < values.size(); ++i)
        values[i] = static_cast<std::int32_t>(
            std::clamp(std::floor(start[i] + rates[i] * seconds), 0.0, most));
    values[currentEvents] = std::min(values[currentEvents], values[queueSize]);
    values[maxEvents] =
        std::min(std::max(values[maxEvents], values[currentEvents]), values[queueSize]);
    return values;
}

Counters defaultCounters() {
    return {{1, 0, 128, 0, 4, 0, 1}, {0, 0, 0, 0, 0, 1, 0}};
}

} // namespace kvlsim
