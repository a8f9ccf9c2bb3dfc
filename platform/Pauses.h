// SPDX-License-Identifier: BSD-2-Clause
// How a thread waits awake for a lock that will soon be free. Not a public header.
#pragma once

#include <sched.h>
#include <unistd.h>

#if defined(__x86_64__) || defined(__i386__)
#include <immintrin.h>
#endif

namespace KVL {

/// Tells the processor that the thread waits for another one: spares power, and lets the other
/// thread of the same core run.
inline void pause_once() {
#if defined(__x86_64__) || defined(__i386__)
    _mm_pause();
#elif defined(__aarch64__)
    asm volatile("isb" ::: "memory"); // `yield` does nothing on most cores
#elif defined(__arm__) && __ARM_ARCH >= 7
    asm volatile("yield" ::: "memory");
#elif defined(__powerpc__)
    asm volatile("or 27,27,27" ::: "memory"); // lowers the thread's priority for a moment
#elif defined(__riscv)
    asm volatile(".insn i 0x0F, 0, x0, x0, 0x010" ::: "memory"); // `pause`, older: a `fence`
#else
    asm volatile("" ::: "memory");
#endif
}

inline void pause_times(int count) {
    for (int i = 0; i < count; ++i)
        pause_once();
}

/// The number of processors that the process may use: 1 or more. A process is bound as its main
/// thread is.
inline int usable_processors() {
    cpu_set_t processors;
    if (sched_getaffinity(getpid(), sizeof processors, &processors) == 0)
        return CPU_COUNT(&processors);
    auto const online = static_cast<int>(sysconf(_SC_NPROCESSORS_ONLN)); // more than a set holds
    return online < 1 ? 1 : online;
}

/// Pauses before a thread tries a lock again: after the first failure, and, doubled each time, up
/// to the longest.
inline constexpr int kShortestWait = 256;
inline constexpr int kLongestWait = 2048;

/// The longest wait of a thread that could sleep instead. On one processor the thread that holds
/// the lock cannot run meanwhile, so there is none.
constexpr int longest_wait(int processors) {
    return processors == 1 ? 0 : kLongestWait;
}

} // namespace KVL
