// SPDX-License-Identifier: BSD-2-Clause
// Which boards' lines have changed, asked once for all boards.
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <vector>

#include "boardplatform/ds1_line.h"

/// The `LineGenerations` are what the platform answers to LINE_GENERATIONS, asked once in each pass
/// of the `LineScheduler`.
///
/// Thread-bound: the scheduler's thread.
class LineGenerations {
  public:
    /// The process's instance, never destroyed. Thread-safe.
    static LineGenerations& instance();

    /// Those of a board's lines when the pass began; generation 0 when the platform has no answer.
    /// `place`: where they stood in the pass before, and stand now.
    DS1BoardGeneration of(long board, std::size_t& place);

  private:
    void ask();
    std::size_t ask(long root);
    bool enlarge();

    std::uint64_t m_pass = 0; ///< in which the platform was asked
    std::vector<DS1BoardGeneration> m_buffer;
    std::span<DS1BoardGeneration const> m_boards; ///< the answer, in `m_buffer`
};
