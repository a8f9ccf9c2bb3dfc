// SPDX-License-Identifier: BSD-2-Clause
// The steps of a walk over an indexed table of handles, each under one hold of the table's lock.
// All are thread-safe.
#pragma once

#include "core/IndexedTable.h"

namespace KVL {

/// The entry at the lowest index, or an empty handle.
template <class Value>
Value first_entry(IndexedTable<int, Value>& table) {
    ObjectGuard const guard(table);
    return table[table.first_index()];
}

/// A copy of the entry at `index`, or an empty handle.
template <class Value>
Value entry_at(IndexedTable<int, Value>& table, int index) {
    ObjectGuard const guard(table);
    auto const entry = table.entries().find(index);
    return entry == table.entries().end() ? table[index] : entry->second;
}

/// The entry at the next index above `index`; an empty handle when `index` is the highest or is not
/// in the table.
template <class Value>
Value entry_after(IndexedTable<int, Value>& table, int index) {
    ObjectGuard const guard(table);
    auto entry = table.entries().find(index);
    if (entry == table.entries().end() || ++entry == table.entries().end())
        return table[table.next_index(index)];
    return entry->second;
}

template <class Value>
int number_of_entries(IndexedTable<int, Value>& table) {
    ObjectGuard const guard(table);
    return static_cast<int>(table.entries().size());
}

/// The index of the first entry of the same object as `value`; 0 when there is none.
template <class Value>
int index_of(IndexedTable<int, Value>& table, Value const& value) {
    auto* const wanted = value.unlocked();
    ObjectGuard const guard(table);
    auto const found = find_object(table.entries(), wanted);
    return found == table.entries().end() ? 0 : found->first;
}

} // namespace KVL
