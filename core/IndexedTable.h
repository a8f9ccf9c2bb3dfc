// SPDX-License-Identifier: BSD-2-Clause
// A locked, ordered table from small integer indices to handles.
#pragma once

#include <utility>

#include "core/IndexedEntries.h"
#include "core/Object.h"

/// Maps indices to handles `Value`, ascending by index. Index 0 is no index: it ends every walk.
/// Callable from any thread; whoever needs several steps in one piece holds `lock()` around them.
template <class Index, class Value>
class IndexedTable : public Object {
  public:
    using Entries = KVL::IndexedEntries<Index, Value>;

    IndexedTable() : Object(true), m_emptyValue(0) {}
    ~IndexedTable() override = default;

    /// The lowest index; 0 when the table is empty.
    Index first_index() {
        ObjectGuard const guard(*this);
        return m_entries.empty() ? m_endIndex : m_entries.begin()->first;
    }

    /// The next index above `index`; 0 when it is the last one or is not in the table.
    Index next_index(Index index) {
        ObjectGuard const guard(*this);
        auto entry = m_entries.find(index);
        if (entry == m_entries.end() || ++entry == m_entries.end()) return m_endIndex;
        return entry->first;
    }

    /// The value at `index`, or the table's empty value; nothing is inserted. The reference is good
    /// while the caller keeps the entry from being removed.
    Value& operator[](Index index) {
        ObjectGuard const guard(*this);
        auto const entry = m_entries.find(index);
        return entry == m_entries.end() ? m_emptyValue : entry->second;
    }

    /// Removes the first entry that refers to the same object as `value`. Returns whether there was
    /// one. Its handle is dropped after the lock is given back.
    bool remove(Value value) {
        typename Entries::node_type removed;
        ObjectGuard const guard(*this);
        for (auto entry = m_entries.begin(); entry != m_entries.end(); ++entry) {
            if (entry->second.get() != value.get()) continue;
            removed = m_entries.extract(entry);
            return true;
        }
        return false;
    }

    /// The entries themselves, for whoever holds the lock.
    Entries& entries() { return m_entries; }
    /// The index handed out last, for whoever holds the lock. Indices are never handed out twice.
    Index& last_index() { return m_lastIndex; }

  private:
    Entries m_entries;
    Index m_reserved = 1; ///< keeps the fields' places; nothing reads it
    Index m_lastIndex = 0;
    Index m_endIndex = 0;
    Value m_emptyValue;
};

/// Enters `value` under the table's next index, and returns that index.
template <class Index, class Value>
Index enter_at_next_index(IndexedTable<Index, Value>& table, Value value) {
    ObjectGuard const guard(table);
    Index const index = ++table.last_index();
    table.entries().insert_or_assign(index, std::move(value));
    return index;
}
