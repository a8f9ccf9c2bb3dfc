// SPDX-License-Identifier: BSD-2-Clause
// How requests reach the agent and notifications leave it.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

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
    std::function<std::shared_ptr<Snapshot const>()> takeSnapshot;   ///< for a request
    std::function<std::shared_ptr<Snapshot const>()> newestSnapshot; ///< as it is
    Settings& settings;
};

/// Used on the thread that does all SNMP only.
class Front {
  public:
    Front() = default;
    virtual ~Front() = default;
    Front(Front const&) = delete;
    Front& operator=(Front const&) = delete;

    /// Gets ready. False when the agent can not start; what is wrong has been logged.
    virtual bool open() = 0;
    /// From now on requests are answered while `run` runs. Throws std::runtime_error.
    virtual void serve(Served served) = 0;
    /// Where the agent is reached, for a message: "on udp:127.0.0.1:1161".
    virtual std::string place() const = 0;
    /// Good after `serve`.
    virtual NotificationSink& notifications() = 0;

    /// Called when `descriptor` is readable.
    virtual void watch(int descriptor, std::function<void()> readable) = 0;
    /// Called before every sleep; returns when to wake at the latest.
    virtual void beforeSleep(std::function<std::optional<Clock::time_point>()> prepare) = 0;
    /// Serves until `stop`, or until `until`.
    virtual void run(Clock::time_point until = Clock::time_point::max()) = 0;
    virtual void stop() = 0;
};

} // namespace kvloamd
