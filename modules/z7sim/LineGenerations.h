// SPDX-License-Identifier: BSD-2-Clause
// Which boards' lines have changed, asked once for all boards.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "boardplatform/ds1_line.h"

/// A `LineGenerations` asks the platform for LINE_GENERATIONS once in each pass of the
/// `LineScheduler`, and finds the answer for each board.
///
/// Thread-bound: the scheduler's thread.
class LineGenerations {
  public:
    /// The process's instance, never destroyed. Thread-safe.
    static LineGenerations& instance();

    /// What the platform answered for a board when the pass began. Generation 0: it did not answer.
    /// `place`: the board's place in the previous answer, where the search begins; set to its place
    /// in this answer.
    DS1BoardGeneration of(long board, std::size_t& place);

  private:
    void ask();
    std::size_t ask(long root);
    bool enlarge();

    std::uint64_t m_pass = 0; ///< in which the platform was asked
    std::vector<DS1BoardGeneration> m_buffer;
    std::span<DS1BoardGeneration const> m_boards; ///< the answer, in `m_buffer`
};
