// SPDX-License-Identifier: BSD-2-Clause
// Takes a mutex that is held for a few instructions at a time.
#pragma once

#include <pthread.h>

#include "platform/Export.h"

namespace KVL {

/// Waits for a mutex that was not free: looks again at growing intervals, then sleeps.
KVLOAM_API void lock_contended(pthread_mutex_t* mutex);

/// Locks `mutex`. The locks of the reference table are held for some nanoseconds each and taken for
/// every handle; a thread that went to sleep for one would cost both threads a hundred times that,
/// and one that asks too eagerly takes the cache line from the thread that works.
inline void lock_briefly(pthread_mutex_t* mutex) {
    if (pthread_mutex_trylock(mutex) != 0) [[unlikely]]
        lock_contended(mutex);
}

/// Holds a mutex for a scope, taken by `lock_briefly`.
class BriefGuard {
  public:
    explicit BriefGuard(pthread_mutex_t* mutex) : m_mutex(mutex) { lock_briefly(mutex); }
    ~BriefGuard() { pthread_mutex_unlock(m_mutex); }
    BriefGuard(BriefGuard const&) = delete;
    BriefGuard& operator=(BriefGuard const&) = delete;

  private:
    pthread_mutex_t* m_mutex;
};

/// Leaves a lock to others for a while.
void stay_away();

} // namespace KVL
