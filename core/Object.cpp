// SPDX-License-Identifier: BSD-2-Clause
#include "core/Object.h"

#include <cstdio>

#include "core/HandleLists.h"
#include "core/ListKinds.h"
#include "core/RecyclingPool.h"

namespace {
using ListPool = KVL::RecyclingPool<KVL::RootedIIDList>;
} // namespace

Object::Object(bool lockable)
    : m_lock(nullptr), m_interfaces(lockable ? ListPool::take() : KVL::HandleLists::take()) {
    if (!lockable) return;
    try {
        m_lock = new KVLLockable_pthread(RecursiveLock);
    } catch (...) {
        ListPool::give(static_cast<KVL::RootedIIDList*>(m_interfaces));
        throw;
    }
}

// Classes with many objects bring their lock: classes that answer to the identifier of the root
// alone.
Object::Object(Adopt, KVLLockable_pthread* lock) try
    : m_lock(lock), m_interfaces(KVL::HandleLists::take()) {
} catch (...) {
    delete lock;
}

Object::~Object() {
    if (m_lock == nullptr)
        KVL::HandleLists::give(m_interfaces);
    else
        give_back(m_interfaces);
    delete m_lock;
}

void Object::answer_to(KVL::IID const& id) {
    // Objects without a lock give their list back to where handles have theirs from.
    KVL::IIDList* const list =
        m_lock == nullptr ? nullptr : KVL::ListKinds::take(*m_interfaces, id);
    if (list == nullptr) {
        m_interfaces->add(id);
        return;
    }
    give_back(m_interfaces);
    m_interfaces = list;
}

void Object::give_back(KVL::IIDList* list) {
    if (KVL::HandleLists::made(list)) {
        KVL::HandleLists::give(list);
    } else if (KVL::ListKinds::made(list)) {
        KVL::ListKinds::give(list);
    } else {
        list->shrink(1);
        ListPool::give(static_cast<KVL::RootedIIDList*>(list));
    }
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
