// SPDX-License-Identifier: BSD-2-Clause
// The signals that end the agent or have it read its configuration again, as a descriptor.
#pragma once

#include <csignal>
#include <optional>

namespace kvloamd {

enum class Signal { Stop, Reload };

/// SIGTERM, SIGINT and SIGHUP. They are blocked for the whole process: made before any other
/// thread. Throws std::system_error when the system has no descriptor left.
class Signals {
  public:
    Signals();
    ~Signals();
    Signals(Signals const&) = delete;
    Signals& operator=(Signals const&) = delete;

    int descriptor() const { return m_descriptor; }
    /// The next signal that has come; nothing when none has.
    std::optional<Signal> next() const;
    /// From now on SIGTERM and SIGINT end the process at once, for whoever finds the stop too slow.
    void letStopThrough() const;

  private:
    int m_descriptor = -1;
};

} // namespace kvloamd
