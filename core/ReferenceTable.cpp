// SPDX-License-Identifier: BSD-2-Clause
#include "core/ReferenceTable.h"

#include <algorithm>
#include <cstdio>
#include <functional>
#include <iostream>
#include <new>
#include <sstream>
#include <typeinfo>

#include "core/AddressMap.h"
#include "core/RecyclingPool.h"
#include "core/Turns.h"

namespace {
using RecordPool = KVL::RecyclingPool<ReferenceInfo>;

/// Its address identifies the thread.
[[gnu::tls_model("initial-exec")]] thread_local char t_thread;
} // namespace

/// The table's lock, followed on the same cache line by what changes with every entry, so that two
/// threads that use the table alternately exchange one line.
struct alignas(64) ReferenceTable::Records final : KVLLockable_pthread {
    Records() : KVLLockable_pthread(RecursiveLock) {}
    KVL::AddressMap<ReferenceInfo*> map;
    KVL::Turns turns;
};

ReferenceTable* ReferenceTable::m_referenceTable = nullptr;

// The lock lies in the record's cache lines: every copy of a handle uses both.
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
    std::ostringstream text;
    text.exceptions(std::ios::badbit); // when memory runs out, say so and write nothing
    text.imbue(std::cout.getloc());
    text.flags(std::cout.flags());
    text << '\n' << "##Start of ReferenceTable:" << '\n';
    {
        // An object outlives its entry, so that its type can be asked for under the lock.
        KVL::BriefGuard const guard(m_records->get_impl_mutex());
        auto entries = m_records->map.entries();
        std::sort(entries.begin(), entries.end(), [](auto const& a, auto const& b) {
            return std::less<void const*>()(a.first, b.first);
        });
        for (auto const& [address, record] : entries) {
            char count[32];
            std::snprintf(count, sizeof count, "   RefCount %4d", record->count());
            auto const* object = static_cast<Object const*>(address);
            // Deliberate: the address is written in the stream's own base, decimal unless the
            // caller has changed it, in spite of the "0x"; scripts that read the dump expect that.
            text << count << "    obj: "
                 << "Object pointer address is 0x" << reinterpret_cast<std::uintptr_t>(address)
                 << '[' << typeid(*object).name() << ']' << '\n';
        }
    }
    text << "##End of ReferenceTable" << '\n';
    // Written without the lock: standard output may be a pipe that nobody reads, and every handle
    // of the process needs the lock.
    std::cout << text.str() << std::flush;
}

int ReferenceTable::referenced_objects() {
    KVL::BriefGuard const guard(m_records->get_impl_mutex());
    return static_cast<int>(m_records->map.size());
}
