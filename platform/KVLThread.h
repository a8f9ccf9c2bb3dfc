// SPDX-License-Identifier: BSD-2-Clause
// A background thread that runs a Runnable.
#pragma once

#include "platform/Export.h"

enum KVLThreadState : int { KVLThreadRunning = 0, KVLThreadNotRunning = 3 };

class KVLOAM_API KVLThread {
  public:
    virtual ~KVLThread() = default;
    /// Starts the body on a thread of its own. Returns 0, or -1 when there is no body.
    virtual int Start() = 0;
    virtual int Stop() = 0;
    virtual int Join() = 0;
    virtual int TerminateAndWait() = 0;
    /// Suspends the calling thread. Returns 0.
    virtual int Sleep(int seconds) = 0;
    /// A `KVLThreadState`.
    virtual int GetThreadState() = 0;
};
