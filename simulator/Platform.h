// SPDX-License-Identifier: BSD-2-Clause
// The simulated platform of this process: its chassis, its lock and its events.
#pragma once

#include <atomic>
#include <mutex>
#include <shared_mutex>
#include <string>
#include <utility>

#include "simulator/AttributeStore.h"
#include "simulator/Chassis.h"
#include "simulator/EventService.h"
#include "simulator/ProcessTable.h"

namespace kvlsim {

/// A shared mutex under which writers do not starve: readers that come after a waiting writer stand
/// behind it. Not recursive, not even for readers.
class FairSharedMutex {
  public:
    void lock() {
        m_waitingWriters.fetch_add(1);
        m_gate.lock();
        m_mutex.lock();
    }
    void unlock() {
        m_mutex.unlock();
        m_gate.unlock();
        m_waitingWriters.fetch_sub(1);
    }
    void lock_shared() {
        if (m_waitingWriters.load() > 0) std::lock_guard const gate(m_gate);
        m_mutex.lock_shared();
    }
    void unlock_shared() { m_mutex.unlock_shared(); }

  private:
    std::atomic<int> m_waitingWriters = 0;
    std::mutex m_gate;
    std::shared_mutex m_mutex;
};

/// One per process, never destroyed; callable from any thread. Lock order: the store's or the
/// processes' own lock, the chassis, the event service's own lock. No callback runs under the
/// chassis lock.
class Platform {
  public:
    /// The platform, started: the first call loads the chassis that KVLSIM_CHASSIS names (or the
    /// bundled one), unless one is loaded already, and opens the control socket that KVLSIM_SOCKET
    /// names. Never throws: a bad chassis is reported on standard error, and `failure()` tells why
    /// nothing can be answered.
    static Platform& started();
    /// The platform as it is, to give it a chassis before it starts.
    static Platform& instance();

    /// Replaces the chassis; nothing is announced. Its processes take the place of those that are
    /// there; an attribute store that has been made stays.
    void replaceChassis(Chassis chassis);

    /// Calls `look(chassis)` with the chassis held still; null when there is none.
    template <typename Look>
    auto read(Look&& look) {
        std::shared_lock const lock(m_lock);
        return std::forward<Look>(look)(
            static_cast<Chassis const*>(m_loaded ? &m_chassis : nullptr));
    }

    /// Calls `change(chassis)` alone. What it announces goes out in the order of the changes.
    template <typename Change>
    auto write(Change&& change) {
        std::unique_lock const lock(m_lock);
        return std::forward<Change>(change)(m_loaded ? &m_chassis : nullptr);
    }

    /// The clock of the lines of this chassis and of those that come; null: the steady clock.
    void setLineClock(Chassis::LineClock* clock);

    /// Why there is no chassis, in one line.
    std::string failure();

    EventService& events() { return m_events; }
    AttributeStore& store() { return m_store; }
    ProcessTable& processes() { return m_processes; }

  private:
    Platform();
    void loadConfiguredChassis();
    /// Requires: the lock is held alone.
    void putInPlace(Chassis& chassis);

    FairSharedMutex m_lock;
    Chassis m_chassis;
    Chassis::LineClock* m_lineClock = nullptr;
    bool m_loaded = false;
    std::string m_failure;
    EventService m_events;
    AttributeStore m_store;
    ProcessTable m_processes;
};

} // namespace kvlsim
