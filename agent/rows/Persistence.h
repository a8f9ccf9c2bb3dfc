// SPDX-License-Identifier: BSD-2-Clause
// Whether indices and settings survive a restart.
#pragma once

#include <algorithm>

namespace kvloamd {

/// The numbers are kvlPersistence's. A higher one is worse.
enum class Persistence : int {
    Kept = 1,   ///< everything is on disk
    InUse = 2,  ///< another process has locked the file; the agent retries
    Failing = 3 ///< the file cannot be read or written
};

inline Persistence worst(Persistence a, Persistence b) {
    return std::max(a, b);
}

} // namespace kvloamd
