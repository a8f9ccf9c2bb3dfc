// SPDX-License-Identifier: BSD-2-Clause
// The thread on which alarms follow the time.
#pragma once

#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <thread>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// An `AlarmThread` makes alarms follow the time. It has a thread of its own, so that no request
/// waits while thousands of alarms are settled. Thread-safe.
class AlarmThread {
  public:
    /// The shortest time between two advances: events come in bursts.
    static constexpr std::chrono::milliseconds kPause{10};

    /// Makes the alarms follow the time. Returns when to do so again.
    using Advance = std::function<Clock::time_point()>;

    /// Starts the thread, which waits for the first `wake`. Then it calls `advance` at the time
    /// that `advance` has returned, and after every `wake`.
    explicit AlarmThread(Advance advance);
    /// Ends the thread, after an advance that has begun.
    ~AlarmThread();
    AlarmThread(AlarmThread const&) = delete;
    AlarmThread& operator=(AlarmThread const&) = delete;

    /// Calls `advance` soon, because something has changed. Does not wait for it.
    void wake();

  private:
    void run();

    Advance const m_advance;
    std::mutex m_mutex; ///< guards what follows
    std::condition_variable m_wake;
    bool m_isWoken = false;
    bool m_stop = false;

    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
