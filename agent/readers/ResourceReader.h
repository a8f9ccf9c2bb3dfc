// SPDX-License-Identifier: BSD-2-Clause
// Reads the resource devices of boards.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "agent/readers/BoardTurns.h"
#include "agent/readers/PerBoard.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/ResourceRow.h"
#include "agent/rows/Rows.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// A `ResourceReader` reads the resources of boards. Thread-bound: the collector.
class ResourceReader {
  public:
    /// `manager` and `turns` outlive the reader. It reads the boards that are due by `turns`, and
    /// without turns all of them.
    explicit ResourceReader(BoardManager& manager, BoardTurns const* turns = nullptr)
        : m_manager(manager), m_turns(turns) {}

    /// The resources of `boards`, which are ascending by index; the rows are, too. A board that is
    /// not due, or whose resources are as before, shares its rows with the reading before.
    Rows<ResourceRow> read(Rows<BoardRow> const& boards);

  private:
    using Part = std::shared_ptr<std::vector<ResourceRow> const>;

    Part readPart(std::uint32_t boardIndex, Part const& former);

    BoardManager& m_manager;
    BoardTurns const* m_turns;
    PerBoard<Part> m_parts;   ///< null: could not be read
    Rows<ResourceRow> m_rows; ///< of the last reading
};

} // namespace kvloamd
