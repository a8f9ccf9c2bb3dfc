// SPDX-License-Identifier: BSD-2-Clause
// Lets signals end a start that takes too long.
#pragma once

#include <thread>

#include "agent/daemon/Signals.h"
#include "agent/fronts/Wakeup.h"

namespace kvloamd {

/// An `InterruptibleStart` ends the process at once when SIGTERM or SIGINT arrives while it exists:
/// a module or the platform may block the starting thread for ever. Ignores SIGHUP, because the
/// configuration has only just been read.
class InterruptibleStart {
  public:
    /// `signals` outlives this object.
    explicit InterruptibleStart(Signals const& signals);
    ~InterruptibleStart() { end(); }
    InterruptibleStart(InterruptibleStart const&) = delete;
    InterruptibleStart& operator=(InterruptibleStart const&) = delete;

    /// The start is over: from now on signals are left to others.
    void end();

  private:
    void watch();

    Signals const& m_signals;
    Wakeup m_ended;
    std::thread m_thread;
};

} // namespace kvloamd
