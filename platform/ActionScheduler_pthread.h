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

    /// The whole seconds of the system's clock: the clock of the timed wait, so that the loop never
    /// takes a wake-up at its deadline for an early one, as it would by `time()`, which may lag.
    static long now();

    /// Starts the thread and returns when it runs.
    ActionScheduler_pthread();
    /// A scheduler without a thread, whose owner drives it by `run_pass`, and whose now is what
    /// `clock` answers.
    explicit ActionScheduler_pthread(Clock clock);

    int put_item_on_list(Schedulable* target, long period, long when) override;
    int remove_item_from_list(SchedItem* item) override;
    /// These two print an error of the mutex on standard output and go on. They return 0.
    int lock_list() override;
    int unlock_list() override;

    /// Null until the first `GetScheduler`. A driven scheduler may put itself here before that.
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
