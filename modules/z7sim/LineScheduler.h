// SPDX-License-Identifier: BSD-2-Clause
// The seconds of the module's lines.
#pragma once

#include <atomic>
#include <cstdint>

#include "platform/ActionScheduler_pthread.h"

/// The `LineScheduler` ticks the module's interval tables, once a second of the monotonic clock.
///
/// The process's scheduler goes by the system's clock: when that is set back it calls nobody until
/// the time is reached again, and when it is set forward it calls everybody once for each second in
/// between. Neither is a second of a line. This scheduler makes one pass a second whatever the
/// system's clock does. A pass that comes late is not made up for: `time` tells how many were left
/// out.
///
/// Thread-safe. A scheduled action must not call it, and a table must not be destroyed in one.
class LineScheduler : public ActionScheduler_pthread {
  public:
    /// The process's instance. Its thread starts with the first call; never destroyed.
    static LineScheduler& instance();

    /// The time of the pass under way, or of the last one: whole seconds of the monotonic clock.
    static long time() { return s_time.load(std::memory_order_relaxed); }
    /// The number of the pass under way, or of the last one.
    static std::uint64_t passNumber() { return s_passNumber.load(std::memory_order_relaxed); }

    /// Calls `change` while no pass is under way, so that it can change what a scheduled action
    /// uses. `change` must not call the scheduler.
    template <class Change>
    void betweenPasses(Change const& change) {
        ListLock const lock(*this);
        change();
    }

    /// The thread's body. Does not return.
    void Run() override;

  protected:
    LineScheduler();
    ~LineScheduler() override;

    /// Calls everything on the list, as the thread does once a second.
    void pass(long time);

    /// Null until the first `instance`. A scheduler without a thread may be put here before that.
    static std::atomic<LineScheduler*> s_instance;

  private:
    static std::atomic<long> s_time;
    static std::atomic<std::uint64_t> s_passNumber;
};
