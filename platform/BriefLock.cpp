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

} // namespace

void lock_contended(pthread_mutex_t* mutex) {
    for (int pauses = 256; pauses <= 2048; pauses *= 2) {
        for (int i = 0; i < pauses; ++i)
            pauseBriefly();
        if (pthread_mutex_trylock(mutex) == 0) return;
    }
    pthread_mutex_lock(mutex);
}

} // namespace KVL
