// SPDX-License-Identifier: BSD-2-Clause
#include "LineSeconds.h"

#include <algorithm>

void LineSeconds::begin(std::uint32_t age, std::int64_t time) {
    begin(time);
    m_age = age;
    m_hasAge = m_hasBeginning = true;
}

void LineSeconds::begin(std::int64_t time) {
    *this = LineSeconds();
    m_time = time;
}

LineTick LineSeconds::answered(std::uint32_t age, std::int64_t time) {
    std::int64_t const skipped = leftOut(time);
    std::int64_t const passed = std::int64_t{age} - m_age;
    // With this tick. Ahead or behind by one is within the difference of the clocks.
    std::int64_t const ahead = m_ahead + passed - 1;
    bool const startedOver = !m_hasAge || passed < 0;
    bool const standsStill = passed == 0 && m_isStill;
    m_isStill = passed == 0;
    m_age = age;
    m_hasAge = true;
    m_ahead = 0;
    if (!m_hasBeginning || startedOver || standsStill) {
        std::int64_t const more = !startedOver && ahead > 1 ? ahead : 0;
        m_hasBeginning = !standsStill;
        return {1 + std::max(skipped, more), false};
    }
    // Three seconds of the line's age take more than two.
    if (skipped > 0 || passed > 2) return {1 + std::max({skipped, ahead, passed - 2}), false};
    if (ahead >= -1 && ahead <= 1) m_ahead = ahead;
    return {0, true};
}

LineTick LineSeconds::silent(std::int64_t time) {
    std::int64_t const missed = 1 + leftOut(time);
    m_hasBeginning = false;
    m_ahead -= missed;
    return {missed, false};
}

/// The ticks that were left out before that of `time`.
std::int64_t LineSeconds::leftOut(std::int64_t time) {
    std::int64_t const skipped = time - m_time - 1;
    m_time = time;
    return std::max<std::int64_t>(skipped, 0);
}
