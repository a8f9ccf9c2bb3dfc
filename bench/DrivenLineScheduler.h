// SPDX-License-Identifier: BSD-2-Clause
// The scheduler of lines, whose seconds the benchmark drives.
#pragma once

#include "LineScheduler.h"

/// A `LineScheduler` without a thread.
class DrivenLineScheduler final : public LineScheduler {
  public:
    DrivenLineScheduler() = default;

    /// The lines that are made from now on enter the list of this one.
    static DrivenLineScheduler& install() {
        static auto* const scheduler = new DrivenLineScheduler;
        s_instance = scheduler;
        return *scheduler;
    }
    using LineScheduler::pass;
    void passOfNextSecond() { pass(time() + 1); }
};
