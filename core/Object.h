// SPDX-License-Identifier: BSD-2-Clause
// The root of every managed class.
#pragma once

#include "core/IID.h"
#include "platform/BriefLock.h"
#include "platform/KVLLockable_pthread.h"

/// An `Object` is a managed object: made with `new`, given at once to a `ReferenceCounter`, and
/// deleted with its last handle. It has a recursive lock if it is made lockable, and a list of the
/// interface identifiers that it answers to, from the root class down. `lock()` and `unlock()` are
/// thread-safe; derived classes say what their own operations are.
///
/// Do not make a handle of `this` in a constructor or destructor: dropping it would delete the
/// object.
class KVLOAM_API Object {
  public:
    /// `lockable`: whether the object gets a recursive lock. The default serves classes that have
    /// `Object` as a virtual base, where the most derived class calls this constructor.
    explicit Object(bool lockable = true);
    virtual ~Object();
    Object(Object const&) = delete;
    Object& operator=(Object const&) = delete;

    /// Takes the object's lock; the thread that holds it may take it again. Returns 0. An object
    /// without a lock prints a line on standard output and returns 99.
    int lock();
    /// Releases the lock. Returns as `lock` does, and 4 when the calling thread does not hold it.
    int unlock();

    /// The identifiers that the object answers to; owned by the object, never null.
    KVL::IIDList* interfaces() const { return m_interfaces; }

  protected:
    /// Selects the constructor that adopts a lock, so that `Object(0)` means "not lockable".
    struct Adopt {};
    /// An object with the lock `lock`, which it owns from the call on, even if construction fails.
    Object(Adopt, KVLLockable_pthread* lock);

    /// Adds `id` to the identifiers that the object answers to. Only for constructors of the
    /// library's own classes: the list may become another one, with the same identifiers before
    /// `id`.
    [[gnu::visibility("hidden")]] void answer_to(KVL::IID const& id);

    /// The lock itself; null when the object was made without one.
    KVLLockable* lockable() const { return m_lock; }

    /// The mutex of `lockable()`, for short critical sections; null without a lock.
    pthread_mutex_t* mutex() const { return m_lock ? m_lock->get_impl_mutex() : nullptr; }

  private:
    friend class ObjectGuard;

    [[gnu::visibility("hidden")]] static void give_back(KVL::IIDList* list);

    KVLLockable_pthread* m_lock;
    KVL::IIDList* m_interfaces;
};

/// An `ObjectGuard` holds an object's lock for a scope. For an object without a lock it prints what
/// `lock()` prints and continues.
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
