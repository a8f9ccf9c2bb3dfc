// SPDX-License-Identifier: BSD-2-Clause
// The process-wide table of reference counts, keyed by object address.
#pragma once

#include <atomic>
#include <cstdint>
#include <new>

#include "core/Object.h"

/// A `ReferenceInfo` is the record of one object's handles: their number, and the lock under which
/// it changes. `lock()`, `unlock()` and `count()` are thread-safe.
class KVLOAM_API ReferenceInfo {
  public:
    ReferenceInfo();
    ~ReferenceInfo();
    ReferenceInfo(ReferenceInfo const&) = delete;
    ReferenceInfo& operator=(ReferenceInfo const&) = delete;

    void lock() { KVL::lock_briefly(mutex()); }
    void unlock() { pthread_mutex_unlock(mutex()); }

    std::int32_t count() const { return m_count.load(std::memory_order_relaxed); }
    /// Adds a handle. Requires the lock.
    void raise() { m_count.store(count() + 1, std::memory_order_relaxed); }
    /// Sets the count to 0, for the next object.
    void reset() { m_count.store(0, std::memory_order_relaxed); }
    /// Removes a handle. Requires the lock. Returns the remaining count.
    std::int32_t lower() {
        std::int32_t const left = count() - 1;
        m_count.store(left, std::memory_order_relaxed);
        return left;
    }

  private:
    /// The mutex of the lock, found without reading `m_lock`: every copy of a handle needs it
    /// twice.
    pthread_mutex_t* mutex() {
        return std::launder(reinterpret_cast<KVLLockable_pthread*>(m_lockStorage))
            ->get_impl_mutex();
    }

    std::atomic<std::int32_t> m_count{0};
    KVLLockable_pthread* m_lock; ///< recursive; lives in the storage below
    alignas(KVLLockable_pthread) unsigned char m_lockStorage[sizeof(KVLLockable_pthread)];
};

/// A `ReferenceTable` maps each object that has handles to the record that they share. The process
/// has one, which is never destroyed. Thread-safe; only the first `get_instance()` must return
/// before threads share handles.
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

    /// The record of `object`; null when it has none. `object` is not dereferenced.
    virtual ReferenceInfo* get_refinfo(Object* object);
    /// The record of `object`, as `get_refinfo` answers it; made with count 0 when it has none.
    /// Null for null.
    virtual ReferenceInfo* create_refinfo(Object* object);
    /// Removes and destroys the record of `object`, if it has one. The record's lock must not be
    /// held.
    virtual void destroy_refcount(Object* object);
    /// Prints every entry, in the order of addresses, on standard output. Entries are read a few at
    /// a time, without the lock in between; an object that comes or goes meanwhile may be missing.
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

    /// The record of `object`, which is not null, made with count 0 when it has none.
    ReferenceInfo* find_or_make(Object* object);
    /// The record of `object`, which is not null, with one handle more. A new record is counted
    /// before another thread can see it, and therefore without its lock.
    ReferenceInfo* add_handle(Object* object);

    static ReferenceTable* m_referenceTable;

    Records* m_records; ///< owned by `Object`, as its lock
};
