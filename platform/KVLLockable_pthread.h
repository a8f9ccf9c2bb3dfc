// SPDX-License-Identifier: BSD-2-Clause
// The one concrete lock, over a POSIX mutex.
#pragma once

#include <pthread.h>

#include <string>

#include "platform/KVLLockable.h"

/// The kinds of mutex. Any other value leaves the mutex's kind at the system's default.
enum LockType : int {
    ErrorCheckLock = 0,
    RecursiveLock = 1, ///< what every object lock of the library is
    NormalLock = 2
};

/// A POSIX mutex. Must not be held when it is destroyed.
class KVLOAM_API KVLLockable_pthread : public KVLLockable {
  public:
    explicit KVLLockable_pthread(LockType type);
    ~KVLLockable_pthread() override;
    KVLLockable_pthread(KVLLockable_pthread const&) = delete;
    KVLLockable_pthread& operator=(KVLLockable_pthread const&) = delete;

    int lock() override;
    int trylock() override;
    int unlock() override;
    /// `result`: what a `pthread_mutex_...` call returned. Answers a `KVLLockCode`.
    int GetError(int result) override;

    /// The text that belongs to a result, for diagnostics; empty for 0.
    static std::string GetErrorText(int result);

    /// The mutex itself, for code that hands it to a POSIX call.
    pthread_mutex_t* get_impl_mutex() { return &m_mutex; }

  private:
    pthread_mutex_t m_mutex;
    pthread_mutexattr_t m_attributes;
};
