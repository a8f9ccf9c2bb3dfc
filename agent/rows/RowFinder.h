// SPDX-License-Identifier: BSD-2-Clause
// Finds rows by their index.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <optional>

namespace kvloamd {

/// A `RowFinder` finds rows by the first number of their index, by which they are ascending. It
/// keeps a reference to them. Finding the row after the one that was found last takes constant
/// time, any other search logarithmic time. Unsynchronised.
template <class All>
class RowFinder {
    using Row = typename All::value_type;

  public:
    explicit RowFinder(All const& rows) : m_rows(rows) {}

    /// Null when there is none; there is none of index 0.
    Row const* find(std::uint32_t index) const {
        auto const place = placeOf(index);
        return place ? &m_rows[*place] : nullptr;
    }
    /// The row's place; nothing when there is none.
    std::optional<std::size_t> placeOf(std::uint32_t index) const {
        if (index == 0) return std::nullopt;
        if (m_next >= m_rows.size() || m_rows[m_next].index()[0] != index) {
            auto const found = std::ranges::partition_point(
                m_rows, [&](Row const& row) { return row.index()[0] < index; });
            if (found == m_rows.end() || found->index()[0] != index) return std::nullopt;
            m_next = static_cast<std::size_t>(found - m_rows.begin());
        }
        return m_next++;
    }

    /// Whether the row after the one that was found last is this one, by its address. The row need
    /// not be there any more.
    bool isNext(Row const* row) const { return m_next < m_rows.size() && &m_rows[m_next] == row; }
    /// Finds the row after the one that was found last. Requires that there is one.
    void skip() const { ++m_next; }

  private:
    All const& m_rows;
    mutable std::size_t m_next = 0; ///< the place after the last row that was found
};

} // namespace kvloamd
