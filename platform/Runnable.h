// SPDX-License-Identifier: BSD-2-Clause
// The body of a thread.
#pragma once

#include "platform/Export.h"

/// A `Runnable` is the body of a thread.
class KVLOAM_API Runnable {
  public:
    /// Called on the thread, which ends when this returns.
    virtual void Run() = 0;

  protected:
    ~Runnable() = default;
};
