// SPDX-License-Identifier: BSD-2-Clause
#include "platform/BriefLock.h"

#include "platform/Pauses.h"

namespace KVL {

namespace {

int longestWait() {
    static int const longest = longest_wait(usable_processors());
    return longest;
}

} // namespace

void stay_away() {
    if (longestWait() != 0) pause_times(4 * kShortestWait);
}

void lock_contended(pthread_mutex_t* mutex) {
    int const longest = longestWait();
    for (int count = kShortestWait; count <= longest; count *= 2) {
        pause_times(count);
        if (pthread_mutex_trylock(mutex) == 0) return;
    }
    pthread_mutex_lock(mutex);
}

} // namespace KVL
