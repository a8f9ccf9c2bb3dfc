// SPDX-License-Identifier: BSD-2-Clause
// The rules by which a line's counters cross limits.
#pragma once

#include <array>
#include <bitset>
#include <cstddef>
#include <cstdint>
#include <optional>

#include "agent/rows/InterfaceRows.h"
#include "agent/rows/ThresholdRow.h"

namespace kvloamd {

/// A `LineThresholds` follows the counters of one line and knows which limits it has crossed.
///
/// A limit for 15 minutes is crossed as soon as the running interval has counted it. It stays
/// crossed until a later interval has ended with less. A limit for 24 hours is on the valid closed
/// intervals and the running one together, a window of 24 hours that moves with each interval. It
/// is crossed as soon as these have counted it, and stays crossed until an interval has ended after
/// which they are less.
///
/// An interval that missed data proves that a limit was reached, if it was, but never that it was
/// not. The newest closed interval may still be corrected: if this lifts it to the limit, the limit
/// was crossed in it. Everything follows from the history alone, so an agent that was not running
/// comes to the same result. The one exception is a crossing that a correction has taken back: it
/// is remembered until the interval after it ends, and forgotten at a restart.
///
/// A limit that changes is judged as if it had always been what it is now. Unsynchronised.
class LineThresholds {
  public:
    using Crossed = std::bitset<kThresholds>;

    /// Looks at the line's counters. `line` keeps a history.
    Crossed look(LineLimits const& limits, LineRow const& line);

  private:
    struct State {
        int limit = 0;
        /// The number of the newest interval in which the limit was reached; none: not crossed.
        std::optional<std::int64_t> crossed;
    };

    static void lookAtInterval(State& state, std::size_t counter, LineRow const& line);
    static void lookAtDay(State& state, std::size_t counter, LineRow const& line);

    std::uint64_t m_history = 0; ///< `LineRow::history`
    std::array<State, kThresholds> m_states;
};

} // namespace kvloamd
