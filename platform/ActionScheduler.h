// SPDX-License-Identifier: BSD-2-Clause
// The scheduler's bookkeeping: who is called back when.
#pragma once

#include <vector>

#include "platform/Runnable.h"
#include "platform/Schedulable.h"

/// One entry of the scheduler's list.
struct SchedItem {
    Schedulable* target; ///< not owned
    long due;            ///< seconds since the epoch
    long period;         ///< seconds; 0 or less: called once
};

/// Calls objects back, periodically or once. An object is on the list once at most. All times are
/// whole seconds; times since the epoch are those of the system's clock.
///
/// The public operations may be called from any thread but from no scheduled action: they wait
/// while an action runs. Locks that an action takes come after the list's lock.
class KVLOAM_API ActionScheduler : public Runnable {
  public:
    virtual ~ActionScheduler();
    ActionScheduler(ActionScheduler const&) = delete;
    ActionScheduler& operator=(ActionScheduler const&) = delete;

    /// Takes `target` off the list; on return no action of it runs. Returns 0, or 1 when it is not
    /// on the list.
    virtual int Remove(Schedulable* target) = 0;
    /// Gives a periodic entry another period and moves its next call by the difference. Returns 0;
    /// 1, changing nothing, when `target` is not on the list, is called only once, or has that
    /// period. A period of 0 or less makes the next call the last.
    virtual int ChangePeriod(Schedulable* target, long period) = 0;

  protected:
    ActionScheduler() = default;

    using List = std::vector<SchedItem>;

    /// What "nothing to wait for" is written as.
    static constexpr long kNever = 0x7FFFFFFF;

    // From here on: the list's lock is held.

    /// Enters `target`, due in `period` seconds from now, or at `when` where the period is 0 or
    /// less. Returns 0.
    virtual int put_item_on_list(Schedulable* target, long period, long when) = 0;
    /// Does nothing and returns 0.
    virtual int remove_item_from_list(SchedItem* item) = 0;
    virtual int lock_list() = 0;
    virtual int unlock_list() = 0;

  public:
    /// Calls `target` every `period` seconds, first `period` seconds from now; with a period of 0
    /// or less once, at once. Returns 0; 1, changing nothing, when `target` is on the list already.
    int AddPeriodic(Schedulable* target, long period);
    /// Calls `target` once, at `when`, in seconds since the epoch (not from now): a time that has
    /// passed means at once. Returns 0; 1, changing nothing, when `target` is on the list already.
    int AddOneTimeAction(Schedulable* target, long when);

  protected:
    bool check_on_list(Schedulable* target);
    /// The first entry of `target` in the order of due times, or the list's end.
    List::iterator find_item_on_list(Schedulable* target);
    /// Enters an item behind those that are due at the same time.
    void insert(SchedItem const& item);

    /// What the loop does when it wakes at `now`: calls everything that is due, earliest first, and
    /// sets the next wake-up time. Woken before that time it calls nothing.
    ///
    /// Deliberate: after a pass the next wake-up is that of the earliest entry that was just called
    /// and will be called again; entries that were not due do not count. One of those that is due
    /// earlier waits until then, or until a change of the list wakes the loop.
    void run_pass(long now);

    /// Below zero or above what fits, a time stays at the last one that fits.
    static long add_saturated(long time, long seconds);

    long m_nextWakeUp = kNever;
    List m_list; ///< by due time; items due at the same time as they were entered

  private:
    void callDue(long now);
    /// The first entry that is due after `time`.
    List::iterator firstAfter(long time);
};
