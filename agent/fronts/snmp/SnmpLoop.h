// SPDX-License-Identifier: BSD-2-Clause
// Opens the agent's addresses and serves them, together with descriptors of the agent's own.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <vector>

#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// Used on the thread that does all SNMP only.
class SnmpLoop {
  public:
    /// Called when `descriptor` is readable.
    void watch(int descriptor, std::function<void()> readable);

    /// Called before every sleep; returns when to wake at the latest.
    void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare);

    /// Opens an address such as udp:127.0.0.1:1161. Returns what is wrong, one line; empty: done.
    static std::string listen(std::string const& address);

    /// Serves until `stop`, or until `until`.
    void run(Clock::time_point until);
    void stop() { m_stop = true; }

  private:
    struct Watched {
        int descriptor;
        std::function<void()> readable;
    };

    void step(Clock::time_point until);

    std::vector<Watched> m_watched;
    std::function<std::optional<Clock::time_point>()> m_prepare;
    bool m_stop = false;
};

} // namespace kvloamd
