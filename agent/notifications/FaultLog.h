// SPDX-License-Identifier: BSD-2-Clause
// Keeps the faults that are raised now.
#pragma once

#include <compare>
#include <cstddef>
#include <cstdint>
#include <ctime>
#include <map>
#include <mutex>

#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// Bounded: when the list is full, a fault that is not in it is counted only. A fault is known by
/// its board and its value; of a board that the agent does not know, by the platform's number of
/// the board. All operations may be called from any thread; none calls out.
class FaultLog {
  public:
    static constexpr std::size_t kCapacity = 4096;

    explicit FaultLog(std::size_t capacity = kCapacity) : m_capacity(capacity) {}

    /// `boardIndex`: 0 when the board is not known.
    void raise(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    void clear(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    /// The platform's number turns out to be this board's: its faults are the board's.
    void boardIsKnown(std::uint32_t boardIndex, int platformBoard);
    /// The board's faults have gone with it.
    void boardHasGone(std::uint32_t boardIndex);

    /// `started`: the agent's start, from which times count. Faults of one value of several unknown
    /// boards make one row.
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
    mutable std::mutex m_mutex; ///< guards what follows
    std::map<Key, Fault> m_faults;
    std::uint32_t m_raised = 0;
    std::uint32_t m_unlisted = 0;
    Clock::time_point m_lastChange; ///< of the epoch: none yet
};

} // namespace kvloamd
