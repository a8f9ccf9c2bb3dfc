// SPDX-License-Identifier: BSD-2-Clause
// A lock, as every managed object may carry one.
#pragma once

#include "platform/Export.h"

/// A mutex behind an abstract face. All operations may be called from any thread and answer a lock
/// code (`KVLLockCode`).
class KVLOAM_API KVLLockable {
  public:
    virtual ~KVLLockable() = default;
    virtual int lock() = 0;
    virtual int trylock() = 0;
    virtual int unlock() = 0;
    /// Maps a result of the underlying implementation to a lock code.
    virtual int GetError(int result) = 0;
};

/// What the lock operations answer.
enum KVLLockCode : int {
    KVLLockOk = 0,
    KVLLockBusy = 1,           ///< held by another thread
    KVLLockDeadlock = 2,       ///< already held by this thread, and not recursive
    KVLLockNotInitialized = 3, ///< not a usable mutex
    KVLLockNotOwner = 4,       ///< unlocked by a thread that does not hold it
    KVLLockUnknown = 99        ///< anything else; also: an object without a lock
};
