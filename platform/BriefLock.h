// SPDX-License-Identifier: BSD-2-Clause
// Takes a mutex that is held for a few instructions at a time.
#pragma once

#include <pthread.h>

#include "platform/Export.h"

namespace KVL {

/// Locks a mutex that was not free: retries at growing intervals, then sleeps. On a single
/// processor it sleeps at once.
KVLOAM_API void lock_contended(pthread_mutex_t* mutex);

/// Locks `mutex`. Every handle takes the locks of the reference table, and each is held for a few
/// instructions only. Sleeping and waking takes both threads far longer than that; retrying without
/// a pause takes the cache line away from the thread that holds the lock.
inline void lock_briefly(pthread_mutex_t* mutex) {
    if (pthread_mutex_trylock(mutex) != 0) [[unlikely]]
        lock_contended(mutex);
}

/// A `BriefGuard` holds a mutex for a scope, taken by `lock_briefly`.
class BriefGuard {
  public:
    explicit BriefGuard(pthread_mutex_t* mutex) : m_mutex(mutex) { lock_briefly(mutex); }
    ~BriefGuard() { pthread_mutex_unlock(m_mutex); }
    BriefGuard(BriefGuard const&) = delete;
    BriefGuard& operator=(BriefGuard const&) = delete;

  private:
    pthread_mutex_t* m_mutex;
};

/// Lets other threads use a lock for a few microseconds. Returns at once on a single processor.
void stay_away();

} // namespace KVL
