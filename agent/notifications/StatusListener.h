// SPDX-License-Identifier: BSD-2-Clause
// Receives the status changes of boards.
#pragma once

#include <functional>
#include <mutex>
#include <thread>
#include <utility>

#include "agent/notifications/NotificationQueue.h"
#include "agent/readers/BoardSource.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// A `StatusListener` queues a notification for each status change of a board. It reads the board's
/// serial number at once, on the reporting thread, because the board may be gone later.
///
/// While the agent starts, the factories report the boards that they find on the starting thread.
/// These are not changes and are ignored; changes that other threads report meanwhile are not.
///
/// Never destroyed: the board manager and the library's threads keep plain pointers to it until the
/// process ends. Thread-safe.
class StatusListener final : public BoardStatusListener {
  public:
    /// Requires that the calling thread attaches the factories. All referenced objects live as long
    /// as the process. `enterprise`: the arc above KVL-OAM-MIB.
    StatusListener(BoardManager& manager, BoardSource& source, NotificationQueue& queue,
                   Counters& counters, Oid enterprise)
        : m_manager(manager),
          m_source(source),
          m_queue(queue),
          m_counters(counters),
          m_enterprise(std::move(enterprise)) {}

    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

    /// Receives every status change that is not ignored, on the thread that reported it.
    using Observer = std::function<void(int boardIndex, Board& board, BoardStatusEnum status)>;
    /// Before the factories are attached.
    void observe(Observer observer) { m_observer = std::move(observer); }

    /// Requires that all factories are attached. From now on calls `changed` after each status
    /// change, on the thread that reported it.
    void start(std::function<void()> changed);
    /// From now on changes are ignored. `changed` is not called any more when this returns.
    void stop();

  private:
    enum class Phase { Starting, Running, Stopped };

    BoardManager& m_manager;
    BoardSource& m_source;
    NotificationQueue& m_queue;
    Counters& m_counters;
    Oid const m_enterprise;
    Observer m_observer; ///< may be empty
    std::thread::id const m_startingThread = std::this_thread::get_id();
    std::mutex m_mutex; ///< guards the next two fields; held while `m_changed` runs
    Phase m_phase = Phase::Starting;
    std::function<void()> m_changed;
};

} // namespace kvloamd
