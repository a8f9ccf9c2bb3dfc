// SPDX-License-Identifier: BSD-2-Clause
// The board platform's runtime library: statistics of each process that uses it.
#pragma once

#include <cstddef>
#include <cstdint>

#pragma GCC visibility push(default)

/// A `tag_KPXSTATISTICS` holds one process's statistics. The layout is the platform's; counters are
/// in host byte order.
struct tag_KPXSTATISTICS {
    char name[32]; ///< not terminated if it fills the field
    std::int32_t reserved1;
    std::int32_t reserved2;
    std::int32_t numberOfOpens;
    std::int32_t numberOfCloses;
    std::int32_t eventQueueSize;
    std::int32_t currentEventsOnQueue;
    std::int32_t maxEventsOnQueue;
    std::int32_t totalQueuedEvents;
    std::int32_t numberOfHandlers;
};

static_assert(sizeof(tag_KPXSTATISTICS) == 68);
static_assert(offsetof(tag_KPXSTATISTICS, numberOfOpens) == 40);
static_assert(offsetof(tag_KPXSTATISTICS, numberOfHandlers) == 64);

extern "C" {

/// Fills `pids` with at most `max` process ids and returns how many.
int _kp_getpids(int* pids, int max);
/// Returns -1 if the process is not known.
int _kp_getstatsbypid(int pid, tag_KPXSTATISTICS* record);
}

#pragma GCC visibility pop
