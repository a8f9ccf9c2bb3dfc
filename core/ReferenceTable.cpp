// SPDX-License-Identifier: BSD-2-Clause
#include "core/ReferenceTable.h"

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <iostream>
#include <map>
#include <memory>
#include <new>
#include <sstream>
#include <string>
#include <typeinfo>
#include <utility>
#include <vector>

#include "core/AddressMap.h"
#include "core/RecyclingPool.h"
#include "core/Turns.h"

namespace {

/// An `Entry` is a record in the table. The address and the link lie in the record's cache lines,
/// which everyone who asks for a record uses next.
struct Entry : ReferenceInfo {
    Object* key = nullptr;
    Entry* next = nullptr; ///< in the bucket
};

/// What `dump()` shows of an object.
struct Shown {
    std::int32_t count;
    std::string type;
};

using EntryPool = KVL::RecyclingPool<Entry>;
using Map = KVL::AddressMap<Entry>;

/// The buckets that `dump()` reads under one hold of the lock.
constexpr std::uint32_t kBucketsAtATime = 256;

/// Its address identifies the thread.
[[gnu::tls_model("initial-exec")]] thread_local char t_thread;

} // namespace

/// The table's lock, followed on the same cache line by what every search reads and what changes
/// with every entry, so that two threads that use the table alternately exchange one line.
struct alignas(64) ReferenceTable::Records final : KVLLockable_pthread {
    Records() : KVLLockable_pthread(RecursiveLock) {}

    /// The entry of `object`. When there is none, `made` becomes true and the new entry has a count
    /// of 1 if `counted`, else of 0. Inlined, because a call is a thirtieth of a second handle.
    [[gnu::always_inline]] Entry* findOrMake(Object* object, bool counted, bool& made);
    /// Gives the map another segment. Without memory, the map stays as it is.
    [[gnu::visibility("hidden")]] void grow() noexcept;
    /// All entries, as far as they are there throughout.
    std::map<Object const*, Shown> show();

    Map map;
    KVL::Turns turns;
    int dumps = 0; ///< under way; the map does not shrink meanwhile
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

inline Entry* ReferenceTable::Records::findOrMake(Object* object, bool counted, bool& made) {
    EntryPool::reserve();
    bool inStep = false;
    bool growing = false;
    Entry* entry = nullptr;
    {
        KVL::BriefGuard const guard(get_impl_mutex());
        entry = map.find(object);
        if (entry != nullptr) return entry;
        entry = EntryPool::take();
        if (counted) entry->raise();
        entry->key = object;
        map.insert(entry);
        made = true;
        growing = map.wantsSegment();
        inStep = turns.note(&t_thread);
    }
    if (growing) [[unlikely]]
        grow();
    if (inStep) [[unlikely]]
        KVL::stay_away();
    return entry;
}

ReferenceInfo* ReferenceTable::find_or_make(Object* object) {
    bool made = false;
    return m_records->findOrMake(object, false, made);
}

ReferenceInfo* ReferenceTable::add_handle(Object* object) {
    bool made = false;
    ReferenceInfo* const record = m_records->findOrMake(object, true, made);
    if (!made) {
        record->lock();
        record->raise();
        record->unlock();
    }
    return record;
}

void ReferenceTable::Records::grow() noexcept {
    try {
        auto segment = std::make_unique<Map::Segment>();
        KVL::BriefGuard const guard(get_impl_mutex());
        map.provide(segment);
    } catch (std::bad_alloc const&) { // a later entry asks again
    }
}

void ReferenceTable::destroy_refcount(Object* object) {
    if (object == nullptr) return;
    Entry* entry = nullptr;
    std::unique_ptr<Map::Segment> unused; // freed without the lock
    {
        KVL::BriefGuard const guard(m_records->get_impl_mutex());
        entry = m_records->map.erase(object);
        if (m_records->dumps == 0) unused = m_records->map.shrink();
    }
    if (entry == nullptr) return;
    entry->reset();
    EntryPool::give(entry);
}

std::map<Object const*, Shown> ReferenceTable::Records::show() {
    // While the map does not shrink, entries move to higher buckets only, so that none is missed.
    // One that is read twice is shown once.
    struct NoShrinking {
        explicit NoShrinking(Records& of) : records(of) { change(1); }
        ~NoShrinking() { change(-1); }
        void change(int by) {
            KVL::BriefGuard const guard(records.get_impl_mutex());
            records.dumps += by;
        }
        Records& records;
    } const noShrinking(*this);

    std::map<Object const*, Shown> all;
    std::vector<std::pair<Object const*, Shown>> some;
    for (std::uint32_t bucket = 0;;) {
        some.clear();
        {
            KVL::BriefGuard const guard(get_impl_mutex());
            if (bucket == map.buckets()) return all;
            std::uint32_t const end = std::min(bucket + kBucketsAtATime, map.buckets());
            for (; bucket < end; ++bucket)
                map.visit(bucket, [&](Entry const& entry) {
                    // An object outlives its entry, so that its type can be asked for here.
                    some.push_back({entry.key, {entry.count(), typeid(*entry.key).name()}});
                });
        }
        for (auto& [object, shown] : some)
            all.insert_or_assign(object, std::move(shown));
    }
}

void ReferenceTable::dump() {
    std::ostringstream text;
    text.exceptions(std::ios::badbit); // when memory runs out, say so and write nothing
    text.imbue(std::cout.getloc());
    text.flags(std::cout.flags());
    text << '\n' << "##Start of ReferenceTable:" << '\n';
    for (auto const& [object, shown] : m_records->show()) {
        char count[32];
        std::snprintf(count, sizeof count, "   RefCount %4d", shown.count);
        // Deliberate: the address is written in the stream's own base, decimal unless the caller
        // has changed it, in spite of the "0x"; scripts that read the dump expect that.
        text << count << "    obj: "
             << "Object pointer address is 0x" << reinterpret_cast<std::uintptr_t>(object) << '['
             << shown.type << ']' << '\n';
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
