// SPDX-License-Identifier: BSD-2-Clause
// The one concrete action scheduler, on a POSIX thread.
#pragma once

#include <pthread.h>

#include <ctime>

#include "platform/ActionScheduler.h"
#include "platform/KVLThread_pthread.h"

/// An `ActionScheduler_pthread` is the process's scheduler. Its thread sleeps until the next
/// wake-up time and never ends.
class KVLOAM_API ActionScheduler_pthread : public ActionScheduler, public KVLThread_pthread {
  public:
    /// Returns the process's scheduler. The first call creates it with its thread, and must return
    /// before other threads call this. Never destroyed. If the system refuses the thread, the
    /// scheduler keeps its list but calls nothing (see `KVLThread_pthread::HasThread`).
    static ActionScheduler* GetScheduler();

    /// The thread's body. Does not return.
    void Run() override;
    /// Requires that the thread does not run.
    ~ActionScheduler_pthread() override;

    int Remove(Schedulable* target) override;
    int ChangePeriod(Schedulable* target, long period) override;

  protected:
    using Clock = long (*)();

    /// The whole seconds of the system's clock. The timed wait uses the same clock; `time()` may
    /// lag behind it, and the loop would then take a wake-up at its deadline for an early one.
    static long now();

    /// Starts the thread and waits until it runs; does not wait if the system refuses it.
    ActionScheduler_pthread();
    /// Makes a scheduler without a thread. Its owner drives it by `run_pass`; `clock` returns the
    /// time.
    explicit ActionScheduler_pthread(Clock clock);

    int put_item_on_list(Schedulable* target, long period, long when) override;
    int remove_item_from_list(SchedItem* item) override;
    /// Lock and unlock the list. Both return 0; they print an error of the mutex on standard output
    /// and carry on.
    int lock_list() override;
    int unlock_list() override;

    /// Null until the first `GetScheduler`. A driven scheduler may set itself here before that.
    static ActionScheduler_pthread* s_actionScheduler;

  private:
    /// Waits until the next wake-up time or a change of the list.
    void waitForChange();

    timespec m_deadline{};
    pthread_mutex_t m_listMutex;
    pthread_mutexattr_t m_listMutexAttributes;
    pthread_cond_t m_listChanged;
    pthread_condattr_t m_listChangedAttributes;
    pthread_cond_t m_started;
    pthread_condattr_t m_startedAttributes;
    Clock m_clock;
    bool m_running = false; ///< guarded by the list's mutex
};
