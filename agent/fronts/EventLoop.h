// SPDX-License-Identifier: BSD-2-Clause
// Waits for descriptors and deadlines, and calls their handlers.
#pragma once

#include <poll.h>

#include <functional>
#include <optional>
#include <span>
#include <vector>

#include "agent/rows/Clock.h"

namespace kvloamd {

/// An `EventLoop` is the loop of the SNMP thread: it sleeps until a descriptor is ready or a
/// deadline has come, and then calls the handlers. Thread-bound to the SNMP thread.
class EventLoop {
  public:
    /// A `Source` contributes descriptors that change from turn to turn.
    class Source {
      public:
        virtual ~Source() = default;

        /// Appends the descriptors to wait for. Returns the source's deadline, if it has one.
        virtual std::optional<Clock::time_point> prepare(std::vector<pollfd>& polled) = 0;
        /// Called after every sleep. `polled` are the descriptors that `prepare` appended, with
        /// what happened to each.
        virtual void handle(std::span<pollfd const> polled) = 0;
    };

    /// Calls `readable` when `descriptor` is readable.
    void watch(int descriptor, std::function<void()> readable);
    /// Calls `prepare` before every sleep; it returns its deadline, if it has one.
    void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare);
    /// Adds a source, which outlives the loop's last `run`.
    void add(Source& source) { m_sources.push_back(&source); }

    /// Serves until `stop` is called or `until` is reached.
    void run(Clock::time_point until);
    void stop() { m_stop = true; }

  private:
    struct Watched {
        int descriptor;
        std::function<void()> readable;
    };

    void turn(Clock::time_point until);

    std::vector<Watched> m_watched;
    std::vector<Source*> m_sources;
    std::function<std::optional<Clock::time_point>()> m_prepare;
    bool m_stop = false;
};

} // namespace kvloamd
