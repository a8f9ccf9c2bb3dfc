// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/LineThresholds.h"

#include <cstdint>
#include <utility>

namespace kvloamd {

namespace {

// The places of the counters in `LineCounts`: errored, severely errored, unavailable and controlled
// slip seconds, path coding violations.
constexpr std::array<std::size_t, kThresholds / 2> kCounters{0, 1, 3, 4, 5};

} // namespace

LineThresholds::Crossed LineThresholds::look(LineLimits const& limits, LineRow const& line) {
    if (std::exchange(m_history, line.history) != line.history) m_states = {};
    Crossed crossed;
    for (std::size_t threshold = 0; threshold < kThresholds; ++threshold) {
        State& state = m_states[threshold];
        if (state.limit != limits[threshold]) state = {limits[threshold], std::nullopt};
        if (state.limit <= 0) continue;
        std::size_t const counter = kCounters[threshold / 2];
        if (threshold % 2 == 0)
            lookAtInterval(state, counter, line);
        else
            lookAtDay(state, counter, line);
        crossed[threshold] = state.crossed.has_value();
    }
    return crossed;
}

void LineThresholds::lookAtInterval(State& state, std::size_t counter, LineRow const& line) {
    if (line.running[counter] >= state.limit) {
        state.crossed = line.intervalsClosed;
        return;
    }
    // The newest interval that proves something.
    for (std::size_t n = 1; n <= line.closedIntervals(); ++n) {
        std::int64_t const number = line.intervalsClosed - static_cast<std::int64_t>(n);
        if (state.crossed && number <= *state.crossed) return;
        std::int32_t const count = line.closed->counts[n - 1][counter];
        if (count >= state.limit) {
            state.crossed = number;
            return;
        }
        if (line.isValid(n) && count >= 0) {
            state.crossed.reset();
            return;
        }
    }
}

void LineThresholds::lookAtDay(State& state, std::size_t counter, LineRow const& line) {
    std::int32_t const closed = line.closed->total[counter];
    std::int32_t const running = line.running[counter];
    if (closed < 0 || running < 0) return;
    if (std::int64_t{closed} + running >= state.limit) {
        state.crossed = line.intervalsClosed;
        return;
    }
    bool const hasEnded = state.crossed < line.intervalsClosed;
    if (hasEnded && line.closedIntervals() > 0 && line.isValid(1)) state.crossed.reset();
}

} // namespace kvloamd
