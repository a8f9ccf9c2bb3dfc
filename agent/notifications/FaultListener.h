// SPDX-License-Identifier: BSD-2-Clause
// Receives the faults that the board platform reports.
#pragma once

#include <atomic>
#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

#include "access/ExternalFaultEventAdaptor.h"
#include "agent/notifications/FaultLog.h"
#include "agent/notifications/NotificationQueue.h"
#include "agent/readers/BoardFinder.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// A `FaultListener` enters the platform's faults in the fault log and queues a notification for
/// each.
///
/// A fault names its board by a platform board number: the board's logical identifier, or the
/// driver's number of a board that has none. The listener maps these numbers to boards seen in
/// earlier status changes. A fault is therefore never assigned to a board that was inserted later,
/// and no board is queried except the one whose status changed.
///
/// Never destroyed: the library's threads keep plain pointers to it until the process ends.
/// Thread-safe.
class FaultListener final : public ExternalFaultEventListener, public BoardStatusListener {
  public:
    /// All referenced objects live as long as the process. `enterprise`: the arc above KVL-OAM-MIB.
    FaultListener(BoardManager& manager, FaultLog& faults, NotificationQueue& queue, Oid enterprise)
        : m_manager(manager),
          m_faults(faults),
          m_queue(queue),
          m_enterprise(std::move(enterprise)) {}

    int ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) override;
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

    /// Receives every fault that is not ignored, on the thread that reported it.
    using Observer = std::function<void(FaultChange const&)>;
    /// Before faults are reported.
    void observe(Observer observer) { m_observer = std::move(observer); }

    /// From now on calls `changed` after each fault, on the thread that reported it.
    void start(std::function<void()> changed);
    /// From now on faults are ignored. `changed` is not called any more when this returns.
    void stop();

  private:
    struct KnownBoard {
        int index = 0;
        std::string serialNumber;
        std::optional<int> logicalId;
    };

    /// The board index of `board`; 0 if it has none.
    int indexOf(ReferenceCounter<Board> const& board);
    /// Fills in the board and enters the fault in the log, both before the board can be removed.
    void enter(FaultChange& change);
    void noteBoard(KnownBoard board);
    void forgetBoard(int index);
    /// Null when no board has this number. Requires `m_boardsMutex`.
    KnownBoard const* find(int platformBoard);
    void notifyChanged();

    BoardManager& m_manager;
    FaultLog& m_faults;
    NotificationQueue& m_queue;
    Oid const m_enterprise;
    Observer m_observer;          ///< may be empty
    std::atomic<int> m_newest{0}; ///< the highest board index found

    /// Guards the next two fields, and that the log holds no fault of a board that has been
    /// removed.
    std::mutex m_boardsMutex;
    /// By board index, highest first: of two boards with one number, the newer has replaced the
    /// other.
    std::map<int, KnownBoard, std::greater<>> m_boards;
    std::optional<BoardFinder> m_finder; ///< valid until the next status change

    std::mutex m_mutex; ///< guards the next two fields; held while `m_changed` runs
    bool m_stopped = false;
    std::function<void()> m_changed;
};

} // namespace kvloamd
