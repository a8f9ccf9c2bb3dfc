// SPDX-License-Identifier: BSD-2-Clause
#include "platform/BriefLock.h"

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#endif

namespace KVL {

namespace {

void pauseBriefly() {
#if defined(__x86_64__) || defined(__i386__)
    _mm_pause();
#else
    asm volatile("" ::: "memory");
#endif
}

constexpr int kFirstPauses = 256;

void pauses(int count) {
    for (int i = 0; i < count; ++i)
        pauseBriefly();
}

} // namespace

void stay_away() {
    pauses(4 * kFirstPauses);
}

void lock_contended(pthread_mutex_t* mutex) {
    for (int count = kFirstPauses; count <= 8 * kFirstPauses; count *= 2) {
        pauses(count);
        if (pthread_mutex_trylock(mutex) == 0) return;
    }
    pthread_mutex_lock(mutex);
}

} // namespace KVL
