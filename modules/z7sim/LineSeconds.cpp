// SPDX-License-Identifier: BSD-2-Clause
#include "LineSeconds.h"

#include <algorithm>

void LineSeconds::begin(std::uint32_t age, std::int64_t time) {
    begin(time);
    m_zero = m_age = age;
    m_hasAge = m_hasBeginning = true;
}

void LineSeconds::begin(std::int64_t time) {
    *this = LineSeconds();
    m_time = time;
}

LineTick LineSeconds::answered(std::uint32_t age, std::int64_t time) {
    std::int64_t const skipped = leftOut(time);
    std::int64_t const passed = age - m_age;
    // By how much the line's age is ahead of this tick; ahead by one is within the difference of
    // the clocks.
    std::int64_t const ahead = age - m_zero - (m_position + 1);
    bool const startedOver = !m_hasAge || passed < 0;
    m_still = passed == 0 ? m_still + 1 : 0;
    bool const standsStill = m_still > 1;
    m_age = age;
    m_hasAge = true;
    if (!m_hasBeginning || startedOver || standsStill) {
        std::int64_t const more = !startedOver && ahead > 1 ? ahead : 0;
        LineTick const tick = miss(1 + std::max(skipped, more));
        m_zero = age - m_position;
        m_hasBeginning = !standsStill;
        return tick;
    }
    // Three seconds of the line's age take more than two.
    if (skipped > 0 || passed > 2) {
        LineTick const tick = miss(1 + std::max({skipped, ahead, passed - 2}));
        m_zero = age - m_position;
        return tick;
    }
    ++m_position;
    m_zero += std::clamp<std::int64_t>(ahead, -1, 1) == ahead ? 0 : ahead;
    return {0, true};
}

LineTick LineSeconds::silent(std::int64_t time) {
    m_hasBeginning = false;
    return miss(1 + leftOut(time));
}

/// The ticks that were left out before that of `time`.
std::int64_t LineSeconds::leftOut(std::int64_t time) {
    std::int64_t const skipped = time - m_time - 1;
    m_time = time;
    return std::max<std::int64_t>(skipped, 0);
}

LineTick LineSeconds::miss(std::int64_t seconds) {
    m_position += seconds;
    return {seconds, false};
}
