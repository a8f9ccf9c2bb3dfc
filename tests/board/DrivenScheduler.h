// SPDX-License-Identifier: BSD-2-Clause
// The process's scheduler, driven by the test.
#pragma once

#include "platform/ActionScheduler_pthread.h"

/// A scheduler without a thread that stands in for the process's scheduler. No second passes until
/// the test lets it pass.
class DrivenScheduler final : public ActionScheduler_pthread {
  public:
    /// Installs the one instance of the process. Requires that nothing has called `GetScheduler()`
    /// before the first `install()`.
    static DrivenScheduler& install() {
        static auto* const instance = new DrivenScheduler;
        return *instance;
    }

    /// Runs the passes of the next `count` seconds on the calling thread.
    void passSeconds(int count) {
        lock_list();
        run_pass(s_now);
        for (int i = 0; i < count; ++i)
            run_pass(++s_now);
        unlock_list();
    }

  private:
    DrivenScheduler() : ActionScheduler_pthread([] { return s_now; }) { s_actionScheduler = this; }

    static inline long s_now = 0;
};
