// SPDX-License-Identifier: BSD-2-Clause
// Which seconds of a DS1 line were seen, and which were missed.
#pragma once

#include <cstdint>

/// What a tick stands for: seconds that were missed, or one whose data was read.
struct LineTick {
    std::int64_t missed = 0;
    bool counts = false;
};

/// A `LineSeconds` accounts for the time of one line, tick by tick. Ticks come once a second of a
/// monotonic clock and carry its time; each reading of the line carries the line's own age. The
/// data of a second is the difference of two readings, so a second is seen when both its beginning
/// and its end were read, and missed when ticks were left out, when the line did not answer, when
/// it began anew, or when its own clock stood still.
///
/// The two clocks are not in step: now and then a second of the one holds two or no seconds of the
/// other. That is no gap.
///
/// Unsynchronised.
class LineSeconds {
  public:
    /// The reading before the first tick. `age` in seconds; `time`: of the tick under way or last.
    void begin(std::uint32_t age, std::int64_t time);
    /// The same for a line that did not answer.
    void begin(std::int64_t time);

    /// The line's age as it was read last.
    std::uint32_t age() const { return m_age; }
    /// Whether a tick at `time` that reads this age is simply the next second, which is seen.
    bool isNext(std::uint32_t age, std::int64_t time) const {
        return m_hasBeginning && !m_isStill && time == m_time + 1 &&
               std::int64_t{age} == std::int64_t{m_age} + 1;
    }
    /// The same as `answered`. Requires that `isNext`.
    void goOn() {
        ++m_time;
        ++m_age;
    }

    LineTick answered(std::uint32_t age, std::int64_t time);
    LineTick silent(std::int64_t time);

  private:
    std::int64_t leftOut(std::int64_t time);

    std::int64_t m_time = 0; ///< of the last tick
    /// By how much the line's age, as read last, is ahead of the seconds accounted for: seen or
    /// missed.
    std::int64_t m_ahead = 0;
    std::uint32_t m_age = 0;     ///< as read last
    bool m_isStill = false;      ///< the age is the one of the tick before
    bool m_hasAge = false;       ///< the line has answered at all
    bool m_hasBeginning = false; ///< the beginning of the second under way was read
};
