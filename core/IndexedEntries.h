// SPDX-License-Identifier: BSD-2-Clause
// The ordered entries of an indexed table.
#pragma once

#include <cstddef>
#include <map>
#include <utility>

namespace KVL {

/// An ordered map that remembers where it was asked last: walks ask for one index after the other,
/// and find the next one without a search. Not synchronised, not even for reading: the table's lock
/// is held around every call.
template <class Index, class Value>
class IndexedEntries {
    using Map = std::map<Index, Value>;

  public:
    using iterator = typename Map::iterator;
    using node_type = typename Map::node_type;

    iterator begin() { return m_map.begin(); }
    iterator end() { return m_map.end(); }
    std::size_t size() const { return m_map.size(); }
    bool empty() const { return m_map.empty(); }

    iterator find(Index index) {
        if (m_last != m_map.end()) {
            if (m_last->first == index) return m_last;
            auto const next = std::next(m_last);
            if (next != m_map.end() && next->first == index) return m_last = next;
        }
        auto const found = m_map.find(index);
        if (found != m_map.end()) m_last = found;
        return found;
    }

    /// Puts `value` at `index`, in place of a former one.
    iterator insert_or_assign(Index index, Value value) {
        return m_map.insert_or_assign(index, std::move(value)).first;
    }
    iterator erase(iterator entry) {
        forget(entry);
        return m_map.erase(entry);
    }
    std::size_t erase(Index index) {
        auto const entry = m_map.find(index);
        if (entry == m_map.end()) return 0;
        erase(entry);
        return 1;
    }
    node_type extract(iterator entry) {
        forget(entry);
        return m_map.extract(entry);
    }
    void clear() {
        m_map.clear();
        m_last = m_map.end();
    }

  private:
    void forget(iterator entry) {
        if (m_last == entry) m_last = m_map.end();
    }

    Map m_map;
    iterator m_last = m_map.end();
};

} // namespace KVL
