// SPDX-License-Identifier: BSD-2-Clause
// The scheduler of the reference module's lines, whose passes a test makes.
#pragma once

#include "LineScheduler.h"

/// The lines' scheduler without a thread: lines tick only when the test makes them. Installed
/// before any line is made.
class StillLineScheduler final : public LineScheduler {
  public:
    static StillLineScheduler& install() {
        static auto* const scheduler = new StillLineScheduler;
        s_instance = scheduler;
        return *scheduler;
    }

    using LineScheduler::pass;

  private:
    StillLineScheduler() = default;
    ~StillLineScheduler() override = default;
};
