// SPDX-License-Identifier: BSD-2-Clause
// The one concrete thread, a detached POSIX thread.
#pragma once

#include <pthread.h>

#include <atomic>

#include "platform/KVLThread.h"
#include "platform/Runnable.h"

/// A `KVLThread_pthread` is a detached POSIX thread that runs one body. It must outlive the body's
/// `Run()`, because nothing waits for the thread. Thread-safe, except that only one thread may call
/// `Start()` and `HasThread()`.
class KVLOAM_API KVLThread_pthread : public KVLThread {
  public:
    /// `body` is not owned and may be null.
    explicit KVLThread_pthread(Runnable* body);
    ~KVLThread_pthread() override;
    KVLThread_pthread(KVLThread_pthread const&) = delete;
    KVLThread_pthread& operator=(KVLThread_pthread const&) = delete;

    /// Starts the body. The state is `KVLThreadRunning` from here until the body returns.
    /// Deliberate: if the system refuses the thread, this returns 0 and the state is
    /// `KVLThreadRunning` all the same. It then writes a line on standard error, and `HasThread()`
    /// is false.
    int Start() override;
    /// Does nothing and returns 0. A body ends by returning from `Run()`.
    int Stop() override;
    /// Does nothing and returns 0.
    int Join() override;
    /// Does nothing and returns 0.
    int TerminateAndWait() override;
    int Sleep(int seconds) override;
    int GetThreadState() override;

    /// Whether the last `Start()` got a thread from the system.
    bool HasThread() const { return m_thread != pthread_t{}; }

  private:
    friend void* kvl_thread_procedure(void* thread);

    Runnable* m_body;
    std::atomic<int> m_state{KVLThreadNotRunning};
    pthread_t m_thread{}; ///< no thread has this value
    pthread_attr_t m_attributes{};
};
