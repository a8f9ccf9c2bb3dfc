// SPDX-License-Identifier: BSD-2-Clause
// A scheduler whose seconds the benchmark drives.
#pragma once

#include "platform/ActionScheduler_pthread.h"

/// A scheduler without a thread.
class DrivenScheduler final : public ActionScheduler_pthread {
  public:
    DrivenScheduler() : ActionScheduler_pthread([] { return 0L; }) {}

    /// Enters a target that is not on the list, with a period of a second.
    void enter(Schedulable* target) { put_item_on_list(target, 1, 0); }
    void passOfNextSecond() { run_pass(m_now++); }

  private:
    long m_now = 0;
};
