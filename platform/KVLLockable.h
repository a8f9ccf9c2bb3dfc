// SPDX-License-Identifier: BSD-2-Clause
// The abstract lock of managed objects.
#pragma once

#include "platform/Export.h"

/// A `KVLLockable` is an abstract mutex. Its operations are thread-safe and return a
/// `KVLLockCode`.
class KVLOAM_API KVLLockable {
  public:
    virtual ~KVLLockable() = default;
    virtual int lock() = 0;
    virtual int trylock() = 0;
    virtual int unlock() = 0;
    /// Maps a result of the underlying implementation to a lock code.
    virtual int GetError(int result) = 0;
};

/// The results of the lock operations.
enum KVLLockCode : int {
    KVLLockOk = 0,
    KVLLockBusy = 1,           ///< held by another thread
    KVLLockDeadlock = 2,       ///< already held by this thread, and not recursive
    KVLLockNotInitialized = 3, ///< not a usable mutex
    KVLLockNotOwner = 4,       ///< unlocked by a thread that does not hold it
    KVLLockUnknown = 99        ///< anything else, also an object without a lock
};
