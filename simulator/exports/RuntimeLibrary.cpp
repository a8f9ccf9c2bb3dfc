// SPDX-License-Identifier: BSD-2-Clause
// The runtime library's statistics functions over the simulated processes.

#include "boardplatform/kpx.h"
#include "simulator/exports/Start.h"

namespace {

constexpr int kFailure = -1;

/// The name is not terminated when it fills the field.
tag_KPXSTATISTICS recordOf(kvlsim::ListedProcess const& process) {
    tag_KPXSTATISTICS record{};
    process.name.copy(record.name, sizeof record.name);
    auto const& counters = process.counters;
    record.numberOfOpens = counters[0];
    record.numberOfCloses = counters[1];
    record.eventQueueSize = counters[2];
    record.currentEventsOnQueue = counters[3];
    record.maxEventsOnQueue = counters[4];
    record.totalQueuedEvents = counters[5];
    record.numberOfHandlers = counters[6];
    return record;
}

kvlsim::ProcessTable& processes() {
    return kvlsim::startedPlatform().processes();
}

} // namespace

int _kp_getpids(int* pids, int max) {
    if (pids == nullptr || max <= 0) return 0;
    int count = 0;
    for (auto const& process : processes().list()) {
        if (count == max) break;
        pids[count++] = process.pid;
    }
    return count;
}

int _kp_getstatsbypid(int pid, tag_KPXSTATISTICS* record) {
    if (record == nullptr) return kFailure;
    auto const process = processes().find(pid);
    if (!process) return kFailure;
    *record = recordOf(*process);
    return 0;
}
