// SPDX-License-Identifier: BSD-2-Clause
// The one concrete thread, over POSIX: detached, ended only by its body.
#pragma once

#include <pthread.h>

#include <atomic>

#include "platform/KVLThread.h"
#include "platform/Runnable.h"

/// The object must outlive its body's `Run()`: the thread is detached, nobody waits for it.
class KVLOAM_API KVLThread_pthread : public KVLThread {
  public:
    /// `body` is not owned and may be null.
    explicit KVLThread_pthread(Runnable* body);
    ~KVLThread_pthread() override;
    KVLThread_pthread(KVLThread_pthread const&) = delete;
    KVLThread_pthread& operator=(KVLThread_pthread const&) = delete;

    /// The state reads `KVLThreadRunning` from here until the body returns.
    /// Deliberate: a thread that the system refuses to create still answers 0 and reads as running.
    int Start() override;
    /// Does nothing; returns 0. A body ends by returning from `Run()`.
    int Stop() override;
    /// Does nothing; returns 0.
    int Join() override;
    /// Does nothing; returns 0.
    int TerminateAndWait() override;
    int Sleep(int seconds) override;
    int GetThreadState() override;

  private:
    friend void* kvl_thread_procedure(void* thread);

    Runnable* m_body;
    std::atomic<int> m_state{KVLThreadNotRunning};
    pthread_t m_thread{};
    pthread_attr_t m_attributes{};
};
