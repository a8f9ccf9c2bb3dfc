// SPDX-License-Identifier: BSD-2-Clause
// The faults that are raised at present.
#pragma once

#include <chrono>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <ctime>
#include <map>
#include <mutex>
#include <optional>
#include <set>

#include "agent/notifications/LineFaults.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// A `FaultLog` is a bounded list of faults. A fault is identified by its board and its value, or
/// by the platform board number and its value while the board is not known. When the list is full,
/// new faults are counted but not listed.
///
/// Several lines of a board may have the same alarm, which the platform reports without the line.
/// Such a fault stays until it has been cleared as often as it was raised, and no line shows it any
/// more. Any other fault stays until it is cleared.
///
/// Thread-safe; no operation makes a callback.
class FaultLog {
  public:
    static constexpr std::size_t kCapacity = 4096;
    /// How long a line fault may be raised before a line shows it. When no line of the board shows
    /// any alarm after this time, a report must have been lost, and the fault is removed.
    static constexpr std::chrono::seconds kLineFaultGrace{30};

    explicit FaultLog(std::size_t capacity = kCapacity) : m_capacity(capacity) {}

    /// Enters a fault, or counts it once more. `boardIndex`: 0 when the board is not known.
    void raise(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    void clear(std::uint32_t boardIndex, int platformBoard, std::uint16_t value);
    /// Compares the line faults with what the lines show, after every refresh of the lines. During
    /// the first `kLineFaultGrace` of a board, enters the faults that its lines show and that no
    /// report has cleared: they were reported before the agent started. Removes those that have
    /// been cleared and are not shown any more. Boards that are not in `shown` are left alone.
    void compare(std::map<std::uint32_t, ShownLineFaults> const& shown, Clock::time_point now);
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
        std::uint32_t lines = 0; ///< of a line fault: raised minus cleared
        Clock::time_point lastRaised;
    };

    struct ComparedBoard {
        Clock::time_point compared;      ///< for the first time
        std::set<std::uint16_t> cleared; ///< line faults since then
    };

    static Key keyOf(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
        return {boardIndex, boardIndex == 0 ? platformBoard : 0, value};
    }

    /// Whether a line of the board showed the fault at the latest refresh.
    bool isShown(Key const& key) const;
    void enter(Key const& key, int platformBoard, std::uint32_t lines, Clock::time_point now);

    std::size_t m_capacity;
    mutable std::mutex m_mutex; ///< guards the fields below
    std::map<Key, Fault> m_faults;
    std::map<std::uint32_t, ShownLineFaults> m_shown;  ///< of the latest refresh, by board index
    std::map<std::uint32_t, ComparedBoard> m_compared; ///< by board index
    std::uint32_t m_raised = 0;
    std::uint32_t m_unlisted = 0;
    std::optional<Clock::time_point> m_lastChange; ///< nothing: the list has not changed yet
};

} // namespace kvloamd
