// SPDX-License-Identifier: BSD-2-Clause
// The ordered entries of an indexed table.
#pragma once

#include <iterator>
#include <map>

namespace KVL {

/// An `IndexedEntries` is an ordered map from indices to values, with the operations of `std::map`.
/// It remembers the entry found last, so that a walk finds the next index without a search.
/// Unsynchronised, also for reading: callers hold the table's lock.
///
/// Not copyable, because `auto entries = table.entries()` would fill a copy. Take a reference.
template <class Index, class Value>
class IndexedEntries : private std::map<Index, Value> {
    using Map = std::map<Index, Value>;

  public:
    using typename Map::const_iterator;
    using typename Map::insert_return_type;
    using typename Map::iterator;
    using typename Map::key_type;
    using typename Map::mapped_type;
    using typename Map::node_type;
    using typename Map::size_type;
    using typename Map::value_type;

    IndexedEntries() = default;
    ~IndexedEntries() = default;
    IndexedEntries(IndexedEntries const&) = delete;
    IndexedEntries& operator=(IndexedEntries const&) = delete;

    using Map::begin;
    using Map::cbegin;
    using Map::cend;
    using Map::end;
    using Map::rbegin;
    using Map::rend;

    using Map::empty;
    using Map::size;

    using Map::at;
    using Map::contains;
    using Map::count;
    using Map::equal_range;
    using Map::lower_bound;
    using Map::upper_bound;

    using Map::emplace;
    using Map::emplace_hint;
    using Map::insert;
    using Map::insert_or_assign;
    using Map::try_emplace;
    using Map::operator[];

    iterator find(Index index) {
        if (m_last != end()) {
            if (m_last->first == index) return m_last;
            auto const next = std::next(m_last);
            if (next != end() && next->first == index) return m_last = next;
        }
        auto const found = Map::find(index);
        if (found != end()) m_last = found;
        return found;
    }
    const_iterator find(Index index) const { return Map::find(index); }

    iterator erase(iterator entry) {
        forget(entry);
        return Map::erase(entry);
    }
    iterator erase(iterator first, iterator last) {
        m_last = end();
        return Map::erase(first, last);
    }
    size_type erase(Index index) {
        auto const entry = Map::find(index);
        if (entry == end()) return 0;
        erase(entry);
        return 1;
    }
    node_type extract(iterator entry) {
        forget(entry);
        return Map::extract(entry);
    }
    void clear() {
        m_last = end();
        Map::clear();
    }

  private:
    void forget(iterator entry) {
        if (m_last == entry) m_last = end();
    }

    iterator m_last = end();
};

} // namespace KVL
