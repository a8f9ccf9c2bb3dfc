// SPDX-License-Identifier: BSD-2-Clause
// The abstract thread.
#pragma once

#include "platform/Export.h"

enum KVLThreadState : int { KVLThreadRunning = 0, KVLThreadNotRunning = 3 };

/// A `KVLThread` is a thread that runs the body it was made with. It cannot be stopped or joined
/// from outside; the concrete class says what these operations do.
class KVLOAM_API KVLThread {
  public:
    virtual ~KVLThread() = default;
    /// Starts the body on a new thread. Returns 0, or -1 if there is no body.
    virtual int Start() = 0;
    virtual int Stop() = 0;
    virtual int Join() = 0;
    virtual int TerminateAndWait() = 0;
    /// Suspends the calling thread. Returns 0.
    virtual int Sleep(int seconds) = 0;
    /// A `KVLThreadState`.
    virtual int GetThreadState() = 0;
};
