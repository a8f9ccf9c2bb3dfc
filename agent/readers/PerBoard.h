// SPDX-License-Identifier: BSD-2-Clause
// What a reader keeps of every board from one reading to the next.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <utility>
#include <vector>

namespace kvloamd {

/// A `PerBoard` keeps something of each board that the last reading has found. A reading calls
/// `begin`, then `at` for every board in the order of the indices, then `end`; what is kept of
/// boards that it does not find is dropped. Unsynchronised.
template <class Kept>
class PerBoard {
  public:
    void begin() { m_next = 0; }
    /// What is kept of the board of this index; a new one for a board that is new. Good until the
    /// next call. Calls `drop(Kept&)` before something is dropped.
    template <class Drop>
    Kept& at(std::uint32_t index, Drop const& drop) {
        dropUntil(index, drop);
        if (m_next == m_all.size() || m_all[m_next].first != index)
            m_all.emplace(m_all.begin() + static_cast<std::ptrdiff_t>(m_next), index, Kept{});
        return m_all[m_next++].second;
    }
    template <class Drop>
    void end(Drop const& drop) {
        dropUntil(std::uint64_t{1} << 32U, drop);
    }

    /// What is kept of the board of this index. Null: nothing.
    Kept* find(std::uint32_t index) {
        auto const found =
            std::ranges::lower_bound(m_all, index, {}, [](auto const& each) { return each.first; });
        return found == m_all.end() || found->first != index ? nullptr : &found->second;
    }
    /// With their board indices, ascending.
    std::vector<std::pair<std::uint32_t, Kept>>& all() { return m_all; }

  private:
    template <class Drop>
    void dropUntil(std::uint64_t index, Drop const& drop) {
        auto const first = m_all.begin() + static_cast<std::ptrdiff_t>(m_next);
        auto last = first;
        for (; last != m_all.end() && last->first < index; ++last)
            drop(last->second);
        if (first != last) m_all.erase(first, last);
    }

    std::vector<std::pair<std::uint32_t, Kept>> m_all;
    std::size_t m_next = 0;
};

} // namespace kvloamd
