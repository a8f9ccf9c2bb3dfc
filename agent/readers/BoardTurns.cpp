// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/BoardTurns.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <utility>

namespace kvloamd {

void BoardTurns::note(std::uint32_t index) {
    std::scoped_lock const guard(m_mutex);
    m_noted.insert(index);
}

void BoardTurns::begin(std::span<int const> present, Clock::time_point now) {
    {
        std::scoped_lock const guard(m_mutex);
        m_due = std::exchange(m_noted, {});
    }
    Clock::duration const passed = now - std::exchange(m_last, now);
    if (present.empty()) return;
    // At least one, so that the turn moves on however often boards are read.
    std::size_t turns = present.size();
    if (passed < kLongest)
        turns = 1 + static_cast<std::size_t>(std::ssize(present) * passed / kLongest);
    auto next = std::ranges::upper_bound(present, m_turn);
    for (turns = std::min(turns, present.size()); turns > 0; --turns) {
        if (next == present.end()) next = present.begin();
        m_turn = *next++;
        m_due.insert(static_cast<std::uint32_t>(m_turn));
    }
}

} // namespace kvloamd
