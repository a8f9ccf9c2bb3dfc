// SPDX-License-Identifier: BSD-2-Clause
// The faults that are raised at present.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <ctime>
#include <map>
#include <mutex>

#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// A `FaultLog` is a bounded list of faults. A fault is identified by its board and its value, or
/// by the platform board number and its value while the board is not known. When the list is full,
/// new faults are counted but not listed. Thread-safe; no operation makes a callback.
class FaultLog {
  public:
    static constexpr std::size_t kCapacity = 4096;

    explicit FaultLog(std::size_t capacity = kCapacity) : m_capacity(capacity) {}

    /// Enters a fault, or counts it once more. `boardIndex`: 0 when the board is not known.
    void raise(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    void clear(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    /// Moves the faults that were entered under the platform board number alone to the board.
    void boardIsKnown(std::uint32_t boardIndex, int platformBoard);
    /// Removes the faults of a board that has been removed.
    void boardHasGone(std::uint32_t boardIndex);

    /// The faults as rows, ascending by index. `started`: the agent's start, from which times
    /// count. Faults of several unknown boards with one value share a row.
    Faults read(Clock::time_point started) const;

  private:
    struct Key {
        std::uint32_t boardIndex;
        int platformBoard; ///< 0 when the board is known
        std::uint16_t value;

        auto operator<=>(Key const&) const = default;
    };
    struct Fault {
        int platformBoard;
        Clock::time_point when;
        std::time_t date;
        std::uint32_t times;
    };

    static Key keyOf(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
        return {boardIndex, boardIndex == 0 ? platformBoard : 0, value};
    }

    std::size_t m_capacity;
    mutable std::mutex m_mutex; ///< guards the fields below
    std::map<Key, Fault> m_faults;
    std::uint32_t m_raised = 0;
    std::uint32_t m_unlisted = 0;
    Clock::time_point m_lastChange; ///< of the epoch: none yet
};

} // namespace kvloamd
