// SPDX-License-Identifier: BSD-2-Clause
// A locked, ordered table from small integer indices to handles.
#pragma once

#include <utility>

#include "core/FindObject.h"
#include "core/IndexedEntries.h"
#include "core/Object.h"

/// An `IndexedTable` maps indices to handles `Value`, in ascending order of indices. Index 0 is
/// never used: it ends every walk. Thread-safe, except where an operation requires the lock; a
/// caller that combines several steps takes the table's `lock()` around them.
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

    /// The next higher index; 0 when `index` is the highest or is not in the table.
    Index next_index(Index index) {
        ObjectGuard const guard(*this);
        auto entry = m_entries.find(index);
        if (entry == m_entries.end() || ++entry == m_entries.end()) return m_endIndex;
        return entry->first;
    }

    /// The value at `index`, or the table's empty value; nothing is inserted. The reference is
    /// valid until the entry is removed; a caller that cannot rule that out holds the lock.
    Value& operator[](Index index) {
        ObjectGuard const guard(*this);
        auto const entry = m_entries.find(index);
        return entry == m_entries.end() ? m_emptyValue : entry->second;
    }

    /// Removes the first entry that refers to the same object as `value`. Returns whether there was
    /// one. The entry's handle is dropped after the lock is released.
    bool remove(Value value) {
        auto const* const wanted = value.get();
        typename Entries::node_type removed;
        ObjectGuard const guard(*this);
        auto const entry = KVL::find_object(m_entries, wanted);
        if (entry == m_entries.end()) return false;
        removed = m_entries.extract(entry);
        return true;
    }

    /// The entries themselves. Requires the lock.
    Entries& entries() { return m_entries; }
    /// The index assigned last; each index is assigned once. Requires the lock.
    Index& last_index() { return m_lastIndex; }

  private:
    Entries m_entries;
    Index m_reserved = 1; ///< not read; keeps the later fields at their offsets
    Index m_lastIndex = 0;
    Index m_endIndex = 0;
    Value m_emptyValue;
};

/// Enters `value` under the table's next index and returns that index. When memory runs out, the
/// table and its next index stay as they are.
template <class Index, class Value>
Index enter_at_next_index(IndexedTable<Index, Value>& table, Value value) {
    ObjectGuard const guard(table);
    Index const index = table.last_index() + 1;
    table.entries().insert_or_assign(index, std::move(value));
    return table.last_index() = index;
}
