// SPDX-License-Identifier: BSD-2-Clause
// Reports the state of the agent to the service manager.
#pragma once

#include <optional>
#include <string>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// A `ServiceNotice` notifies systemd. Without a service manager it does nothing. Thread-bound: the
/// SNMP thread.
class ServiceNotice {
  public:
    /// Reads from the environment whether the service manager expects watchdog messages.
    ServiceNotice();

    /// `status`: one line, which systemctl status shows.
    void ready(std::string const& status) const;
    void reloading() const;
    void stopping() const;

    /// Sends a watchdog message if it is due. Returns the time of the next call.
    std::optional<Clock::time_point> beat();

  private:
    std::optional<Clock::duration> m_pause; ///< between two watchdog messages
    Clock::time_point m_next;
};

} // namespace kvloamd
