// SPDX-License-Identifier: BSD-2-Clause
// A condition variable together with the mutex that guards it.
#pragma once

#include "platform/Export.h"

/// A wait takes the form `grab(0)`, check of the caller's predicate, `wait(n)`, `release()`.
/// All operations may be called from any thread.
class KVLOAM_API KVLConditionVariable {
  public:
    /// Thrown by `wait` when its time is up; the internal mutex is held, so the catcher releases
    /// it.
    class KVLOAM_API WaitTimedOutException {};

    /// Locks the internal mutex. The argument is ignored.
    virtual void grab(int reserved) = 0;
    /// Unlocks the internal mutex.
    virtual void release() = 0;
    /// Waits for a notification; requires that the caller has called `grab`. `seconds` below 1:
    /// with no limit. May return without a notification: the caller checks its predicate again.
    /// Deliberate: the limit is cut to a whole second of the clock, so the wait is up to one second
    /// shorter than asked; periodic callers stay aligned to whole seconds that way.
    virtual void wait(int seconds) = 0;
    /// Wakes one waiter. Takes the internal mutex: never call it between `grab` and `release`.
    virtual void notify() = 0;
    /// Wakes all waiters; otherwise as `notify`.
    virtual void notify_all() = 0;
    virtual ~KVLConditionVariable() = default;
};
