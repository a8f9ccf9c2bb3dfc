// SPDX-License-Identifier: BSD-2-Clause
#include "core/Object.h"

#include <cstdio>

#include "core/RecyclingPool.h"

namespace {

/// A `RootedIIDList` is a list that begins with the identifier of `Object`, as every object's does.
class RootedIIDList : public KVL::IIDList {
  public:
    RootedIIDList() { add(KVL::IID("6Object")); }
};

using ListPool = KVL::RecyclingPool<RootedIIDList>;

} // namespace

Object::Object(bool lockable)
    : Object(Adopt(), lockable ? new KVLLockable_pthread(RecursiveLock) : nullptr) {}

Object::Object(Adopt, KVLLockable_pthread* lock) try
    : m_lock(lock), m_interfaces(ListPool::take()) {
} catch (...) {
    delete lock;
}

Object::~Object() {
    m_interfaces->shrink(1);
    ListPool::give(static_cast<RootedIIDList*>(m_interfaces));
    delete m_lock;
}

int Object::lock() {
    if (m_lock != nullptr) return m_lock->lock();
    std::puts("Attempting to lock a non-lockable object...");
    return KVLLockUnknown;
}

int Object::unlock() {
    if (m_lock != nullptr) return m_lock->unlock();
    std::puts("Attempting to unlock a non-lockable object...");
    return KVLLockUnknown;
}
