// SPDX-License-Identifier: BSD-2-Clause
// A chassis and its lock.
#pragma once

#include <atomic>
#include <mutex>
#include <shared_mutex>
#include <utility>

#include "simulator/chassis/Chassis.h"

namespace kvlsim {

/// A `FairSharedMutex` is a shared mutex under which writers do not starve: readers that come after
/// a waiting writer wait until it is done. Not recursive, not even for readers.
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

/// A `GuardedChassis` is the chassis of a platform with its lock; thread-safe. It is empty until
/// `put` is called.
class GuardedChassis {
  public:
    /// Calls `look(chassis)` while the chassis cannot change; with null when there is none.
    template <typename Look>
    auto read(Look&& look) {
        std::shared_lock const lock(m_lock);
        return std::forward<Look>(look)(
            static_cast<Chassis const*>(m_loaded ? &m_chassis : nullptr));
    }

    /// Calls `change(chassis)` with the chassis locked against all other threads; null when there
    /// is none. Events announced in `change` are delivered in the order of the changes.
    template <typename Change>
    auto write(Change&& change) {
        std::unique_lock const lock(m_lock);
        return std::forward<Change>(change)(m_loaded ? &m_chassis : nullptr);
    }

    /// Replaces the chassis. Its lines start now, not when they were read.
    void put(Chassis chassis);
    /// The same, unless there is a chassis already.
    void putFirst(Chassis chassis);
    /// Sets the clock of the lines of this chassis and of later ones; null: the steady clock.
    void setLineClock(Chassis::LineClock* clock);

  private:
    void putLocked(Chassis& chassis);

    FairSharedMutex m_lock;
    Chassis m_chassis;
    Chassis::LineClock* m_lineClock = nullptr;
    bool m_loaded = false;
};

} // namespace kvlsim
