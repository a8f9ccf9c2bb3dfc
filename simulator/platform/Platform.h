// SPDX-License-Identifier: BSD-2-Clause
// The simulated platform of this process: its chassis, events, attribute store and processes.
#pragma once

#include <mutex>
#include <string>
#include <utility>

#include "simulator/chassis/GuardedChassis.h"
#include "simulator/events/EventService.h"
#include "simulator/runtime/ProcessTable.h"
#include "simulator/store/AttributeStore.h"

namespace kvlsim {

/// The `Platform` is the one of this process: a single instance, never destroyed; thread-safe. Lock
/// order: the store's or the processes' own lock, the chassis, the event service's own lock. No
/// callback runs under the chassis lock.
class Platform {
  public:
    static Platform& instance();

    /// Loads the chassis that KVLSIM_CHASSIS names, or the bundled one, unless one is loaded
    /// already. Never throws: a bad chassis is reported on standard error, and `failure()` says why
    /// nothing can be answered.
    void loadConfiguredChassis();

    /// Replaces the chassis; nothing is announced. Its processes replace the present ones; an
    /// attribute store that has been made stays.
    void replaceChassis(Chassis chassis);

    /// As those of GuardedChassis.
    template <typename Look>
    auto read(Look&& look) {
        return m_chassis.read(std::forward<Look>(look));
    }
    template <typename Change>
    auto write(Change&& change) {
        return m_chassis.write(std::forward<Change>(change));
    }

    /// Why there is no chassis, in one line.
    std::string failure();

    GuardedChassis& chassis() { return m_chassis; }
    EventService& events() { return m_events; }
    AttributeStore& store() { return m_store; }
    ProcessTable& processes() { return m_processes; }

  private:
    Platform();

    GuardedChassis m_chassis;
    std::mutex m_failureLock;
    std::string m_failure;
    EventService m_events;
    AttributeStore m_store;
    ProcessTable m_processes;
};

/// The value of an environment variable, empty when it is not set.
std::string configured(char const* variable);

} // namespace kvlsim
