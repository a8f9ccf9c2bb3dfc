// SPDX-License-Identifier: BSD-2-Clause
// The root of every managed class.
#pragma once

#include "core/IID.h"
#include "platform/BriefLock.h"
#include "platform/KVLLockable_pthread.h"

/// A managed object: made with `new`, handed at once to a `ReferenceCounter`, deleted with the last
/// handle. It may carry a recursive lock of its own, and it carries the list of the interface
/// identifiers that it answers to, from the root class down.
///
/// A handle of `this` must not be made in a constructor or a destructor: dropping it would delete
/// the object.
class KVLOAM_API Object {
  public:
    /// `lockable`: whether the object gets a recursive lock. The default serves classes that have
    /// `Object` as a virtual base, where the most derived class calls this constructor.
    explicit Object(bool lockable = true);
    virtual ~Object();
    Object(Object const&) = delete;
    Object& operator=(Object const&) = delete;

    /// Takes the object's lock; its holder may take it again. Returns 0; without a lock: prints a
    /// line on standard output and returns 99.
    int lock();
    /// Gives the lock back. Returns as `lock`; 4 when the calling thread does not hold it.
    int unlock();

    /// The identifiers that the object answers to; owned by the object, never null.
    KVL::IIDList* interfaces() const { return m_interfaces; }

  protected:
    /// Selects the constructor below, so that `Object(0)` means "not lockable".
    struct Adopt {};
    /// An object with the given lock, which it owns from here on, even if the construction fails.
    Object(Adopt, KVLLockable_pthread* lock);

    /// The lock itself; null when the object was made without one.
    KVLLockable* lockable() const { return m_lock; }

    /// The mutex behind `lockable()`, for our own short critical sections; null without one.
    pthread_mutex_t* mutex() const { return m_lock ? m_lock->get_impl_mutex() : nullptr; }

  private:
    friend class ObjectGuard;

    KVLLockable_pthread* m_lock;
    KVL::IIDList* m_interfaces;
};

/// Holds an object's lock for a scope. On an object without one it prints what `lock()` prints and
/// goes on.
class ObjectGuard {
  public:
    explicit ObjectGuard(Object& object) : m_object(object) {
        if (pthread_mutex_t* const mutex = m_object.mutex())
            KVL::lock_briefly(mutex);
        else
            m_object.lock();
    }
    ~ObjectGuard() {
        if (pthread_mutex_t* const mutex = m_object.mutex())
            pthread_mutex_unlock(mutex);
        else
            m_object.unlock();
    }
    ObjectGuard(ObjectGuard const&) = delete;
    ObjectGuard& operator=(ObjectGuard const&) = delete;

  private:
    Object& m_object;
};
