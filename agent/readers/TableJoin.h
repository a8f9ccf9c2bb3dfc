// SPDX-License-Identifier: BSD-2-Clause
// Puts the tables of all boards together.
#pragma once

#include <algorithm>
#include <cstddef>
#include <functional>
#include <memory>
#include <span>
#include <utility>
#include <vector>

#include "agent/rows/Rows.h"

namespace kvloamd {

/// A `TableJoin` puts a table of all boards together from the boards' own. Unsynchronised.
template <class Row>
class TableJoin {
  public:
    /// `owner` owns the rows that are appended without an owner.
    TableJoin(Rows<Row>& all, std::shared_ptr<void const> owner) : m_all(all) {
        m_all.clear();
        m_all.append({}, std::move(owner));
    }
    /// Appends the rows of a board, which are ascending.
    void append(std::span<Row const> rows, std::shared_ptr<void const> owner = nullptr) {
        if (rows.empty()) return;
        // Boards come in the order of their indices, and mostly got their ifIndices in this order.
        m_sorted = m_sorted && (m_last == nullptr || m_last->index() < rows.front().index());
        m_last = &rows.back();
        m_all.append(rows, std::move(owner));
    }
    void end() {
        if (!m_sorted) m_all.sortBy([](Row const& row) { return row.index(); });
    }

  private:
    Rows<Row>& m_all;
    Row const* m_last = nullptr;
    bool m_sorted = true;
};

/// A `PartExchange` is the part of a joined table that belongs to a board, and the part that
/// replaces it. Null: the board has no part.
template <class Part>
struct PartExchange {
    std::shared_ptr<Part const> former;
    std::shared_ptr<Part const> now;
};

/// A `PartExchanges` collects the parts that are to be exchanged in joined tables, and decides
/// whether the tables are to be joined anew instead: when that is hardly more work, and before
/// tables keep too many former parts in memory. Unsynchronised.
template <class Part>
class PartExchanges {
  public:
    /// Begins to collect, for tables of so many boards. `anew`: they are joined anew anyway.
    void begin(std::size_t boards, bool anew) {
        m_most = std::max(kLeastMost, boards / 8);
        m_areMany = anew;
        m_all.clear();
    }
    /// A board has no more than two exchanges, one directly after the other, which become one.
    void add(std::shared_ptr<Part const> former, std::shared_ptr<Part const> now) {
        if (former == now || m_areMany) return;
        if (former && !m_all.empty() && m_all.back().now == former) {
            m_all.back().now = std::move(now);
            return;
        }
        m_all.push_back({std::move(former), std::move(now)});
        if (m_all.size() + m_sinceJoin <= m_most) return;
        m_areMany = true;
        m_all.clear();
    }

    /// Whether all tables are to be joined anew. If not, `all` is to be exchanged.
    bool areMany() const { return m_areMany; }
    std::vector<PartExchange<Part>> const& all() const { return m_all; }

    /// The tables have been joined anew, or `all` has been exchanged.
    void end() {
        m_sinceJoin = m_areMany ? 0 : m_sinceJoin + m_all.size();
        m_areMany = false;
        m_all.clear();
    }

  private:
    static constexpr std::size_t kLeastMost = 16;

    std::vector<PartExchange<Part>> m_all; ///< none while they are many
    std::size_t m_most = kLeastMost;
    std::size_t m_sinceJoin = 0; ///< how many have been exchanged
    bool m_areMany = false;
};

/// The rows that an exchange takes out of one table and those that it brings, ascending by index.
/// Rows that are the same before and after are not among them.
template <class Row>
struct RowExchange {
    std::vector<Row const*> gone;
    std::vector<Row const*> come;
    std::vector<std::shared_ptr<void const>> owners; ///< of those that come

    /// Whether the table then has rows of other indices.
    bool changesIndices() const {
        auto const index = [](Row const* row) { return row->index(); };
        return !std::ranges::equal(gone, come, {}, index, index);
    }
    void apply(Rows<Row>& table) const {
        if (!gone.empty() || !come.empty()) table.exchange(gone, come, owners);
    }
};

/// `table`: the rows of a part.
template <class Row, class Part, class Table>
RowExchange<Row> exchangeOf(std::vector<PartExchange<Part>> const& parts, Table table) {
    static std::vector<Row> const none;
    RowExchange<Row> exchange;
    for (PartExchange<Part> const& part : parts) {
        std::vector<Row> const& former = part.former ? std::invoke(table, *part.former) : none;
        std::vector<Row> const& now = part.now ? std::invoke(table, *part.now) : none;
        if (former == now) continue;
        for (Row const& row : former)
            exchange.gone.push_back(&row);
        for (Row const& row : now)
            exchange.come.push_back(&row);
        if (part.now) exchange.owners.push_back(part.now);
    }
    auto const index = [](Row const* row) { return row->index(); };
    std::ranges::sort(exchange.gone, {}, index);
    std::ranges::sort(exchange.come, {}, index);
    return exchange;
}

} // namespace kvloamd
