// SPDX-License-Identifier: BSD-2-Clause
// Which boards a refresh reads in full.
#pragma once

#include <chrono>
#include <cstdint>
#include <mutex>
#include <set>
#include <span>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// A `BoardTurns` decides which boards a refresh reads in full. The rows of the others are shared
/// with the snapshot before, as far as a short check finds nothing else there.
///
/// A board is read in full when something has been noted of it since the last refresh, and when
/// it is its turn: the boards take turns so that each is read in full once in `kLongest`, plus the
/// time to the next refresh. That is how long a change may stay unseen of which a board tells
/// nothing.
///
/// `note` is thread-safe. The rest is thread-bound: the collector.
class BoardTurns {
  public:
    static constexpr std::chrono::seconds kLongest{30};

    /// The board of `index` has announced a change.
    void note(std::uint32_t index);

    /// Begins a refresh of the boards `present`, which are ascending.
    void begin(std::span<int const> present, Clock::time_point now);
    /// Whether this refresh reads the board in full.
    bool isDue(std::uint32_t index) const { return m_due.contains(index); }
    /// A short check has found that the board has changed: from now on, this refresh reads it in
    /// full.
    void add(std::uint32_t index) { m_due.insert(index); }

  private:
    std::mutex m_mutex;
    std::set<std::uint32_t> m_noted; ///< since the last refresh
    std::set<std::uint32_t> m_due;
    Clock::time_point m_last; ///< when the last refresh began
    int m_turn = 0;           ///< the board that was the last to have its turn
};

/// Whether a reader of board `index` reads it in full. Without turns (null) it always does.
inline bool isDue(BoardTurns const* turns, std::uint32_t index) {
    return turns == nullptr || turns->isDue(index);
}

} // namespace kvloamd
