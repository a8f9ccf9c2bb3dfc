// SPDX-License-Identifier: BSD-2-Clause
// Tells the service manager that started the agent how it is.
#pragma once

#include <optional>
#include <string>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// Without a service manager, nothing happens. Used on one thread.
class ServiceNotice {
  public:
    /// Asks the environment whether the manager wants to hear that the agent lives.
    ServiceNotice();

    /// `status` is a line for whoever looks.
    void ready(std::string const& status) const;
    void reloading() const;
    void stopping() const;

    /// Says that the agent lives, if it is time. Returns when to come again at the latest.
    std::optional<Clock::time_point> beat();

  private:
    std::optional<Clock::duration> m_pause; ///< between two beats
    Clock::time_point m_next;
};

} // namespace kvloamd
