// SPDX-License-Identifier: BSD-2-Clause
// Notices when threads have a lock in quick turns.
#pragma once

#include <chrono>

namespace KVL {

/// Two threads that make and drop objects in step find a lock free every time, and yet wait every
/// time for its cache line, which the other has just had. Where one stays away for a while, the
/// other gets many turns at the price of one.
///
/// Threads: whoever holds the lock.
class Turns {
  public:
    using Clock = std::chrono::steady_clock;

    /// The lock is `thread`'s now. Whether it should leave the lock alone for a while afterwards.
    bool note(void const* thread) {
        if (m_last == thread) [[likely]] {
            if (m_changes != 0) m_changes = 0;
            return false;
        }
        m_last = thread;
        return ++m_changes == kInStep && noteSteps(Clock::now());
    }

    /// `kInStep` changes in a row, the last of them at `now`: whether they came quickly.
    bool noteSteps(Clock::time_point now) {
        bool const quick = now - m_lastSteps < kQuick;
        m_lastSteps = now;
        m_changes = 0;
        return quick;
    }

  private:
    static constexpr int kInStep = 4;
    /// Threads that come less often do not wait for each other.
    static constexpr std::chrono::microseconds kQuick{20};

    void const* m_last = nullptr;
    int m_changes = 0; ///< in a row
    Clock::time_point m_lastSteps;
};

} // namespace KVL
