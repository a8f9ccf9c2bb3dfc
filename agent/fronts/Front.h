// SPDX-License-Identifier: BSD-2-Clause
// How requests reach the agent and notifications leave it.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include "agent/fronts/Capabilities.h"
#include "agent/fronts/EventLoop.h"
#include "agent/notifications/NotificationSink.h"
#include "agent/objects/ServedTree.h"
#include "agent/rows/Counters.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// What a front serves. Outlives `run`.
struct Served {
    std::vector<ServedTree> trees; ///< the agent's own MIB module first
    Counters& counters;
    std::function<std::shared_ptr<Snapshot const>()> takeSnapshot; ///< to answer a request
    std::function<std::shared_ptr<Snapshot const>()>
        newestSnapshot; ///< without asking for a new one
    Settings& settings;
    std::vector<Capability> capabilities; ///< rows of sysORTable
};

/// A `Front` connects the agent to its SNMP clients by one protocol. Thread-bound to the SNMP
/// thread.
class Front {
  public:
    Front() = default;
    virtual ~Front() = default;
    Front(Front const&) = delete;
    Front& operator=(Front const&) = delete;

    /// Prepares to serve. Returns false when the agent cannot start; the errors have been logged.
    virtual bool open() = 0;
    /// Answers requests from now on, while `run` runs. Throws std::runtime_error.
    virtual void serve(Served served) = 0;
    /// Reads the configuration of access and notification receivers again, if the front has one.
    /// Returns its errors, one line for each; the rest of it is in effect. After `serve`.
    virtual std::vector<std::string> readConfigurationAgain() { return {}; }
    /// Where clients reach the agent, for a message: "on udp:127.0.0.1:1161".
    virtual std::string place() const = 0;
    /// Valid after `serve`.
    virtual NotificationSink& notifications() = 0;

    /// Calls `readable` when `descriptor` is readable.
    void watch(int descriptor, std::function<void()> readable) {
        m_loop.watch(descriptor, std::move(readable));
    }
    /// Calls `prepare` before every sleep; it returns its deadline, if it has one.
    void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) {
        m_loop.beforeSleep(std::move(prepare));
    }
    /// Serves until `stop` is called or `until` is reached.
    void run(Clock::time_point until = Clock::time_point::max()) { m_loop.run(until); }
    void stop() { m_loop.stop(); }

  protected:
    EventLoop& loop() { return m_loop; }

  private:
    EventLoop m_loop;
};

} // namespace kvloamd
