// SPDX-License-Identifier: BSD-2-Clause
// The one concrete lock, a POSIX mutex.
#pragma once

#include <pthread.h>

#include <string>

#include "platform/KVLLockable.h"

/// The kinds of mutex. Any other value means the system's default kind.
enum LockType : int {
    ErrorCheckLock = 0,
    RecursiveLock = 1, ///< the kind of every object lock of the library
    NormalLock = 2
};

/// A `KVLLockable_pthread` is a POSIX mutex. It must not be held when it is destroyed.
class KVLOAM_API KVLLockable_pthread : public KVLLockable {
  public:
    explicit KVLLockable_pthread(LockType type);
    ~KVLLockable_pthread() override;
    KVLLockable_pthread(KVLLockable_pthread const&) = delete;
    KVLLockable_pthread& operator=(KVLLockable_pthread const&) = delete;

    int lock() override;
    int trylock() override;
    int unlock() override;
    /// Maps `result`, the result of a `pthread_mutex_...` call, to a `KVLLockCode`.
    int GetError(int result) override;

    /// A text for a result, for diagnostics; empty for 0.
    static std::string GetErrorText(int result);

    /// The mutex itself, for POSIX calls.
    pthread_mutex_t* get_impl_mutex() { return &m_mutex; }

  private:
    pthread_mutex_t m_mutex;
    pthread_mutexattr_t m_attributes;
};
