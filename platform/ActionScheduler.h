// SPDX-License-Identifier: BSD-2-Clause
// The scheduler's bookkeeping: which object is called back when.
#pragma once

#include <limits>
#include <memory>

#include "platform/Runnable.h"
#include "platform/Schedulable.h"

namespace KVL {
class ActionList;
}

/// A `SchedItem` is one entry of the scheduler's list.
struct SchedItem {
    Schedulable* target; ///< not owned
    long due;            ///< seconds since the epoch
    long period;         ///< seconds; 0 or less: called once
};

/// An `ActionScheduler` calls objects back, periodically or once. An object is on its list at most
/// once. All times are whole seconds; times since the epoch are those of the system's clock.
///
/// The scheduler follows the system's clock, also when that is set: set back, it calls nothing
/// until the clock has caught up; set forward, it makes up for all the calls of a periodic entry
/// that it has missed, one after the other. An action that measures time takes it from a monotonic
/// clock; the number of its calls is no measure.
///
/// Threads: the public operations are thread-safe, but no scheduled action may call them: they wait
/// while an action runs. Locks that an action takes come after the list's lock.
///
/// Entering and removing an object takes a time that does not depend on the number of entries with
/// its due time and period. If memory runs out, an operation throws `std::bad_alloc` and leaves the
/// list as it was.
class KVLOAM_API ActionScheduler : public Runnable {
  public:
    virtual ~ActionScheduler();
    ActionScheduler(ActionScheduler const&) = delete;
    ActionScheduler& operator=(ActionScheduler const&) = delete;

    /// Removes `target` from the list and waits for an action of it under way. Returns 0, or 1 if
    /// it is not on the list.
    virtual int Remove(Schedulable* target) = 0;
    /// Gives a periodic entry another period and moves its next call by the difference. Returns 0.
    /// Changes nothing and returns 1 if `target` is not on the list, is a one-time entry, or has
    /// that period already. A period of 0 or less makes the next call the last.
    virtual int ChangePeriod(Schedulable* target, long period) = 0;

  protected:
    ActionScheduler();

    /// The next wake-up time when there is nothing to wait for: the last time that fits.
    static constexpr long kNever = std::numeric_limits<long>::max();

    // From here on: the list's lock is held.

    /// Enters `target`, due in `period` seconds from now, or at `when` if the period is 0 or less.
    /// Requires that it is not on the list. Returns 0.
    virtual int put_item_on_list(Schedulable* target, long period, long when) = 0;
    /// Does nothing and returns 0.
    virtual int remove_item_from_list(SchedItem* item) = 0;
    virtual int lock_list() = 0;
    virtual int unlock_list() = 0;

  public:
    /// Calls `target` every `period` seconds, first `period` seconds from now; with a period of 0
    /// or less once, at once. Returns 0. Changes nothing and returns 1 if `target` is on the list.
    int AddPeriodic(Schedulable* target, long period);
    /// Like `AddPeriodic`, but a call that is due is left out while `ready(target)` is false. The
    /// scheduler does not touch a target that is not ready, so an object may be on the list before
    /// its construction is complete. `ready` is called on the scheduler's thread, with the list
    /// locked.
    int AddPeriodicWhileReady(Schedulable* target, long period, bool (*ready)(Schedulable*));
    /// Calls `target` once, at `when`, in seconds since the epoch (not from now). A time that has
    /// passed means at once. Returns 0. Changes nothing and returns 1 if `target` is on the list.
    int AddOneTimeAction(Schedulable* target, long when);

  protected:
    /// Holds the list's lock for a scope.
    class ListLock {
      public:
        explicit ListLock(ActionScheduler& scheduler) : m_scheduler(scheduler) {
            m_scheduler.lock_list();
        }
        ~ListLock() { m_scheduler.unlock_list(); }
        ListLock(ListLock const&) = delete;
        ListLock& operator=(ListLock const&) = delete;

      private:
        ActionScheduler& m_scheduler;
    };

    bool check_on_list(Schedulable* target);
    /// The entry of `target`, valid until the list changes; null when it is not on the list.
    SchedItem* find_item_on_list(Schedulable* target);

    /// What the loop does when it wakes at `now`: calls everything that is due, earliest first, and
    /// sets the next wake-up time. Before that time it calls nothing.
    ///
    /// Deliberate: after a pass the next wake-up is that of the earliest entry that was just called
    /// and will be called again; entries that were not due do not count. If one of those is due
    /// earlier, it waits until then, or until a change of the list wakes the loop.
    void run_pass(long now);

    long m_nextWakeUp = kNever;
    std::unique_ptr<KVL::ActionList> m_list;
};
