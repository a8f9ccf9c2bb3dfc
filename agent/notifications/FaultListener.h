// SPDX-License-Identifier: BSD-2-Clause
// Takes the platform's faults off the threads that tell of them.
#pragma once

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

/// A fault names its board by a number: the board's logical identifier, or that of its driver when
/// it has no logical one. Which board that is, is known from the boards' status changes, so that a
/// fault is never another board's, which has come since, and no board is asked but the one that a
/// change is about.
///
/// The library's threads keep plain pointers to the listener until the process ends, so it is never
/// destroyed.
class FaultListener final : public ExternalFaultEventListener, public BoardStatusListener {
  public:
    /// What is referred to lives as long as the process. `enterprise` is the arc above all names of
    /// KVL-OAM-MIB.
    FaultListener(BoardManager& manager, FaultLog& faults, NotificationQueue& queue, Oid enterprise)
        : m_manager(manager),
          m_faults(faults),
          m_queue(queue),
          m_enterprise(std::move(enterprise)) {}

    int ProcessExternalFaultEvent(ReferenceCounter<ExternalFaultEvent> event) override;
    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

    /// `changed` is called on the thread that tells of a fault, until `stop` returns.
    void start(std::function<void()> changed);
    /// Faults are passed over from now on.
    void stop();

  private:
    struct KnownBoard {
        int index = 0;
        std::string serialNumber;
        std::optional<int> logicalId;
    };

    /// Finds the board, and enters the fault before anybody can take the board out.
    void enter(FaultNews& news);
    void noteBoard(KnownBoard board);
    void forgetBoard(int index);
    /// Null when no board is called by this number. With the lock of the boards held.
    KnownBoard const* find(int platformBoard);
    void tellChanged();

    BoardManager& m_manager;
    FaultLog& m_faults;
    NotificationQueue& m_queue;
    Oid const m_enterprise;

    std::mutex m_boardsMutex; ///< guards what follows, and that the log has faults of them only
    /// By index, the newest first: it has taken the place of one that is going.
    std::map<int, KnownBoard, std::greater<>> m_boards;
    std::optional<BoardFinder> m_finder; ///< good until the next status change

    std::mutex m_mutex; ///< guards what follows; held during `m_changed`
    bool m_stopped = false;
    std::function<void()> m_changed;
};

} // namespace kvloamd
