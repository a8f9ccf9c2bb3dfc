// SPDX-License-Identifier: BSD-2-Clause
// The tables of all boards' interfaces, put together from the boards' own.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <utility>
#include <vector>

#include "agent/readers/TableJoin.h"
#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// A `JoinedInterfaces` puts the tables of all boards together. While few boards change, it
/// exchanges the rows of these boards in the tables that it has. Unsynchronised.
class JoinedInterfaces {
  public:
    using Tables = BoardInterfaceRows; ///< of a board, except for the lines
    using Lines = std::vector<LineRow>;
    /// Returns the parts of all boards, ascending by board index.
    template <class Part>
    using PartsOfAll = std::function<std::vector<std::shared_ptr<Part const>>()>;

    /// Begins a reading of so many boards. `anew`: the tables are put together from all boards.
    void begin(std::size_t boards, bool anew);
    // Replaces the rows `former` of a board by the rows `now` when `update` is called. Null: none.
    void exchange(std::shared_ptr<Tables const> former, std::shared_ptr<Tables const> now) {
        m_tables.add(std::move(former), std::move(now));
    }
    void exchange(std::shared_ptr<Lines const> former, std::shared_ptr<Lines const> now) {
        m_lines.add(std::move(former), std::move(now));
    }

    /// Makes all exchanges. `time`: now, in hundredths of a second since the agent's start; nothing
    /// in the first reading.
    void update(PartsOfAll<Tables> const& tables, PartsOfAll<Lines> const& lines,
                std::optional<std::uint32_t> time);
    InterfaceRows const& all() const { return m_all; }

  private:
    void joinTables(std::vector<std::shared_ptr<Tables const>> all);
    void joinStack(std::vector<std::shared_ptr<Tables const>> const& parts,
                   std::shared_ptr<void const> owner);
    /// Returns whether interfaces have come or gone, and whether the stack has changed.
    std::pair<bool, bool> exchangeTables();
    void joinLines(std::vector<std::shared_ptr<Lines const>> const& all);
    void exchangeLines();

    InterfaceRows m_all;
    PartExchanges<Tables> m_tables;
    PartExchanges<Lines> m_lines;
};

} // namespace kvloamd
