// SPDX-License-Identifier: BSD-2-Clause
// The process-wide table of reference counts, keyed by object address.
#pragma once

#include <atomic>
#include <cstdint>
#include <new>

#include "core/Object.h"

/// The count of one object's handles. Changed only under its lock; readable at any time.
class KVLOAM_API ReferenceInfo {
  public:
    ReferenceInfo();
    ~ReferenceInfo();
    ReferenceInfo(ReferenceInfo const&) = delete;
    ReferenceInfo& operator=(ReferenceInfo const&) = delete;

    void lock() { KVL::lock_briefly(mutex()); }
    void unlock() { pthread_mutex_unlock(mutex()); }

    std::int32_t count() const { return m_count.load(std::memory_order_relaxed); }
    /// Requires the lock.
    void raise() { m_count.store(count() + 1, std::memory_order_relaxed); }
    /// Back to no handles, for the next object.
    void reset() { m_count.store(0, std::memory_order_relaxed); }
    /// Requires the lock. Returns the count that is left.
    std::int32_t lower() {
        std::int32_t const left = count() - 1;
        m_count.store(left, std::memory_order_relaxed);
        return left;
    }

  private:
    /// The lock's, found without a look at the pointer: every copy of a handle asks twice.
    pthread_mutex_t* mutex() {
        return std::launder(reinterpret_cast<KVLLockable_pthread*>(m_lockStorage))
            ->get_impl_mutex();
    }

    std::atomic<std::int32_t> m_count{0};
    KVLLockable_pthread* m_lock; ///< recursive; lives in the storage below
    alignas(KVLLockable_pthread) unsigned char m_lockStorage[sizeof(KVLLockable_pthread)];
};

/// Finds the one record that all handles of an object share. Callable from any thread, but the
/// first `get_instance()` must return before threads share handles. Never destroyed.
///
/// Lock order: a record's lock, then the table's.
class KVLOAM_API ReferenceTable : public Object {
  public:
    static ReferenceTable* get_instance() {
        if (m_referenceTable == nullptr) [[unlikely]]
            m_referenceTable = new ReferenceTable;
        return m_referenceTable;
    }

    ~ReferenceTable() override;

    /// The record of `object`; null when it has none, also for an address of no object.
    virtual ReferenceInfo* get_refinfo(Object* object);
    /// The record of `object`, as `get_refinfo` answers it; made with count 0 when it has none.
    /// Null for null.
    virtual ReferenceInfo* create_refinfo(Object* object);
    /// Takes the record of `object` out and destroys it; nothing when it has none. The record's
    /// lock must not be held.
    virtual void destroy_refcount(Object* object);
    /// Prints every entry, in the order of addresses, on standard output.
    virtual void dump();
    /// The number of objects that have handles.
    virtual int referenced_objects();

  protected:
    ReferenceTable();

  private:
    template <class T>
    friend class ReferenceCounter;
    struct Records;

    explicit ReferenceTable(Records* records);

    /// The record of `object`, made with count 0 when it has none, by one search. Handles call this
    /// instead of `create_refinfo`, whose two virtual calls they can do without. Not null.
    ReferenceInfo* find_or_make(Object* object);

    static ReferenceTable* m_referenceTable;

    Records* m_records; ///< owned as the object's lock
};
