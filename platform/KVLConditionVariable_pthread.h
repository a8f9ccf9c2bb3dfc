// SPDX-License-Identifier: BSD-2-Clause
// The one concrete condition variable, a POSIX one.
#pragma once

#include <pthread.h>

#include "platform/KVLConditionVariable.h"

/// A `KVLConditionVariable_pthread` is a POSIX condition variable with its mutex.
class KVLOAM_API KVLConditionVariable_pthread : public KVLConditionVariable {
  public:
    KVLConditionVariable_pthread();
    KVLConditionVariable_pthread(KVLConditionVariable_pthread const&) = delete;
    KVLConditionVariable_pthread& operator=(KVLConditionVariable_pthread const&) = delete;

    void grab(int reserved) override;
    void release() override;
    void wait(int seconds) override;
    void notify() override;
    void notify_all() override;
    ~KVLConditionVariable_pthread() override;

  private:
    pthread_cond_t m_condition;
    pthread_mutex_t m_mutex; ///< not recursive
};
