// SPDX-License-Identifier: BSD-2-Clause
// The signals that stop the agent or reload its configuration, as a descriptor.
#pragma once

#include <csignal>
#include <optional>

namespace kvloamd {

enum class Signal { Stop, Reload };

/// A `Signals` object blocks SIGTERM, SIGINT and SIGHUP and makes them readable on a descriptor. It
/// ignores SIGPIPE for the rest of the process: a peer or log reader that leaves ends nothing.
/// Requires that no other thread has been started, because threads inherit the blocked signals. The
/// constructor throws std::system_error when no descriptor is available.
class Signals {
  public:
    Signals();
    ~Signals();
    Signals(Signals const&) = delete;
    Signals& operator=(Signals const&) = delete;

    int descriptor() const { return m_descriptor; }
    /// Removes the next pending signal; nothing when none is pending.
    std::optional<Signal> next() const;
    /// From now on SIGTERM and SIGINT end the process at once, so that a slow stop can be
    /// interrupted.
    void letStopThrough() const;

  private:
    int m_descriptor = -1;
};

} // namespace kvloamd
