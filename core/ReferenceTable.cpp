// SPDX-License-Identifier: BSD-2-Clause
#include "core/ReferenceTable.h"

#include <algorithm>
#include <cstdio>
#include <functional>
#include <iostream>
#include <new>
#include <typeinfo>

#include "core/AddressMap.h"
#include "core/RecyclingPool.h"
#include "core/Turns.h"

namespace {
using RecordPool = KVL::RecyclingPool<ReferenceInfo>;

/// Its address tells threads apart.
[[gnu::tls_model("initial-exec")]] thread_local char t_thread;
} // namespace

/// The table's lock and behind it, on the same cache line, what changes with every entry: two
/// threads that alternate at the table then exchange one line.
struct alignas(64) ReferenceTable::Records final : KVLLockable_pthread {
    Records() : KVLLockable_pthread(RecursiveLock) {}
    KVL::AddressMap<ReferenceInfo*> map;
    KVL::Turns turns;
};

ReferenceTable* ReferenceTable::m_referenceTable = nullptr;

// The lock shares the record's cache lines: both are touched by every copy of a handle.
ReferenceInfo::ReferenceInfo() : m_lock(new (m_lockStorage) KVLLockable_pthread(RecursiveLock)) {}

ReferenceInfo::~ReferenceInfo() {
    m_lock->~KVLLockable_pthread();
    m_lock = nullptr;
}

ReferenceTable::ReferenceTable() : ReferenceTable(new Records) {}

ReferenceTable::ReferenceTable(Records* records) : Object(Adopt(), records), m_records(records) {}

ReferenceTable::~ReferenceTable() {
    lock();
    unlock();
    m_records->map.clear();
}

ReferenceInfo* ReferenceTable::get_refinfo(Object* object) {
    if (object == nullptr) return nullptr;
    KVL::BriefGuard const guard(m_records->get_impl_mutex());
    return m_records->map.find(object);
}

ReferenceInfo* ReferenceTable::create_refinfo(Object* object) {
    if (object == nullptr) return nullptr;
    ReferenceInfo* const record = get_refinfo(object);
    return record == nullptr ? find_or_make(object) : record;
}

ReferenceInfo* ReferenceTable::find_or_make(Object* object) {
    bool inStep = false;
    ReferenceInfo* record = nullptr;
    {
        KVL::BriefGuard const guard(m_records->get_impl_mutex());
        record = m_records->map.find_or_insert(object, [&] {
            inStep = m_records->turns.note(&t_thread);
            return RecordPool::take();
        });
    }
    if (inStep) [[unlikely]]
        KVL::stay_away();
    return record;
}

void ReferenceTable::destroy_refcount(Object* object) {
    ReferenceInfo* record = nullptr;
    if (object != nullptr) {
        KVL::BriefGuard const guard(m_records->get_impl_mutex());
        record = m_records->map.erase(object);
    }
    if (record != nullptr) {
        record->reset();
        RecordPool::give(record);
    }
}

void ReferenceTable::dump() {
    KVL::BriefGuard const guard(m_records->get_impl_mutex());
    auto entries = m_records->map.entries();
    std::sort(entries.begin(), entries.end(), [](auto const& a, auto const& b) {
        return std::less<void const*>()(a.first, b.first);
    });
    std::cout << '\n' << "##Start of ReferenceTable:" << '\n';
    for (auto const& [address, record] : entries) {
        char count[32];
        std::snprintf(count, sizeof count, "   RefCount %4d", record->count());
        auto const* object = static_cast<Object const*>(address);
        // Deliberate: the address is written in the stream's own base, decimal unless the caller
        // has changed it, in spite of the "0x"; scripts that read the dump expect that.
        std::cout << count << "    obj: "
                  << "Object pointer address is 0x" << reinterpret_cast<std::uintptr_t>(address)
                  << '[' << typeid(*object).name() << ']' << '\n';
    }
    std::cout << "##End of ReferenceTable" << std::endl;
}

int ReferenceTable::referenced_objects() {
    KVL::BriefGuard const guard(m_records->get_impl_mutex());
    return static_cast<int>(m_records->map.size());
}
