// SPDX-License-Identifier: BSD-2-Clause
// Memory as an agent that runs as a service gets it.
#pragma once

#include <unistd.h>

#include <cstdlib>

/// Has the program's memory, ours and the peers', come in huge pages where the system has them for
/// who asks, as the agent's service unit does (debian/kvloamd.service). The C library reads this
/// once, at a program's start, so the program begins anew; a value that is set already counts.
inline void startWithHugePages(char** argv) {
    if (getenv("GLIBC_TUNABLES") == nullptr &&
        setenv("GLIBC_TUNABLES", "glibc.malloc.hugetlb=1", 1) == 0)
        execv("/proc/self/exe", argv);
}
