// SPDX-License-Identifier: BSD-2-Clause
// Passes what the platform reports on to the alarm list, at once.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

#include "agent/alarms/AlarmList.h"
#include "agent/rows/Snapshot.h"
#include "board/Board.h"

namespace kvloamd {

/// An `AlarmEvents` object begins and ends conditions as status changes, faults and line status
/// changes arrive, so that one that is over before the next snapshot is still counted. What has no
/// event of its own is found by `update`, in the snapshot. Never destroyed, because the platform's
/// threads use it until the process ends. Thread-safe.
class AlarmEvents {
  public:
    /// Receives every status change of a board in words, on the thread that reported it.
    using Note = std::function<void(std::string const& text, std::string const& board)>;

    /// `list` lives as long as the process. `note` may be empty. `now`: the time of what happens.
    explicit AlarmEvents(AlarmList& list, Note note = {},
                         std::function<Instant()> now = Instant::now)
        : m_list(list), m_note(std::move(note)), m_now(std::move(now)) {}

    /// The board has changed its status.
    void boardStatus(int boardIndex, Board& board, BoardStatusEnum status);
    /// The platform has reported a fault, or its end. `boardIndex`: 0 when the board is not known.
    void fault(bool raised, int boardIndex, std::string const& serialNumber, std::uint16_t value);
    /// dsx1LineStatus of the line has changed. A line that no snapshot has shown yet is left to the
    /// next snapshot.
    void lineStatus(std::uint32_t ifIndex, int status);

    /// Compares the alarms with a new snapshot.
    void update(Snapshot const& snapshot);

  private:
    /// What identifies a line's conditions.
    struct Line {
        Condition condition; ///< of no kind yet
        int status = 0;      ///< dsx1LineStatus
    };

    /// A `KnownBoard` keeps what alarms need of a board after it was removed.
    struct KnownBoard {
        std::string place;           ///< as `boardPlace`
        bool stoppedInOrder = false; ///< from events: its own status changes during removal
    };

    void rememberLines(Snapshot const& snapshot);
    void rememberBoards(Snapshot const& snapshot);
    void noteStop(std::uint32_t boardIndex, bool inOrder);
    KnownBoard known(std::uint32_t boardIndex);

    AlarmList& m_list;
    Note const m_note;
    std::function<Instant()> const m_now;
    std::mutex m_mutex;                           ///< guards what follows
    std::map<std::uint32_t, Line> m_lines;        ///< by ifIndex, of the newest snapshot
    std::map<std::uint32_t, KnownBoard> m_boards; ///< by board index
};

} // namespace kvloamd
