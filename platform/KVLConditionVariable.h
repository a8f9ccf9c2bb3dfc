// SPDX-License-Identifier: BSD-2-Clause
// A condition variable together with the mutex that guards it.
#pragma once

#include "platform/Export.h"

/// A `KVLConditionVariable` is a condition variable with its own mutex. To wait, a caller calls
/// `grab(0)`, checks its predicate, calls `wait(n)`, checks again, and calls `release()`.
/// Thread-safe.
class KVLOAM_API KVLConditionVariable {
  public:
    /// Thrown by `wait` when its time is up. The internal mutex is held then; the catcher must call
    /// `release`.
    class KVLOAM_API WaitTimedOutException {};

    /// Locks the internal mutex. The argument is ignored.
    virtual void grab(int reserved) = 0;
    /// Unlocks the internal mutex.
    virtual void release() = 0;
    /// Waits for a notification, for at most `seconds`; without a limit if `seconds` is below 1.
    /// Requires that the caller has called `grab`. May return without a notification: the caller
    /// checks its predicate again.
    /// Deliberate: the wait ends at a whole second of the clock, up to one second earlier than
    /// asked, so that periodic callers stay aligned to whole seconds.
    virtual void wait(int seconds) = 0;
    /// Wakes one waiter. Takes the internal mutex: never call it between `grab` and `release`.
    virtual void notify() = 0;
    /// Wakes all waiters. Otherwise like `notify`.
    virtual void notify_all() = 0;
    virtual ~KVLConditionVariable() = default;
};
