// SPDX-License-Identifier: BSD-2-Clause
// Detects threads that take a lock in quick turns.
#pragma once

#include <chrono>

namespace KVL {

/// A `Turns` detects two threads that take a lock alternately, in step: each finds the lock free,
/// but waits for its cache line, which the other thread has just used. When one of them leaves the
/// lock alone for a while, the other takes it many times for the price of one cache line transfer.
///
/// Unsynchronised: the threads call it while they hold the lock.
class Turns {
  public:
    using Clock = std::chrono::steady_clock;

    /// Notes that `thread` has taken the lock. Returns whether it should leave the lock alone for a
    /// while after releasing it.
    bool note(void const* thread) {
        if (m_last == thread) [[likely]] {
            if (m_changes != 0) m_changes = 0;
            return false;
        }
        m_last = thread;
        return ++m_changes == kInStep && noteSteps(Clock::now());
    }

    /// Notes `kInStep` changes in a row, the last one at `now`. Returns whether they came quickly.
    bool noteSteps(Clock::time_point now) {
        bool const quick = now - m_lastSteps < kQuick;
        m_lastSteps = now;
        m_changes = 0;
        return quick;
    }

  private:
    static constexpr int kInStep = 4;
    /// Threads that take the lock less often do not wait for each other's cache line.
    static constexpr std::chrono::microseconds kQuick{20};

    void const* m_last = nullptr;
    int m_changes = 0; ///< of the thread, in a row
    Clock::time_point m_lastSteps;
};

} // namespace KVL
