// SPDX-License-Identifier: BSD-2-Clause
// Takes the board manager's status changes off the threads that tell of them.
#pragma once

#include <functional>
#include <mutex>
#include <thread>
#include <utility>

#include "agent/notifications/NotificationQueue.h"
#include "agent/readers/BoardSource.h"
#include "board/BoardManager.h"

namespace kvloamd {

/// Reads what a change needs at once, on the thread that tells of it, and queues it: later the
/// board may be gone or another one.
///
/// While the agent starts, the factories announce the boards that they find on the agent's own
/// thread; these are no changes and are passed over. A change that another thread tells of
/// meanwhile is one.
///
/// The board manager and the library's threads keep plain pointers to the listener until the
/// process ends, so it is never destroyed.
class StatusListener final : public BoardStatusListener {
  public:
    /// Made on the thread that attaches the factories. What is referred to lives as long as the
    /// process. `enterprise` is the arc above all names of KVL-OAM-MIB.
    StatusListener(BoardManager& manager, BoardSource& source, NotificationQueue& queue,
                   Counters& counters, Oid enterprise)
        : m_manager(manager),
          m_source(source),
          m_queue(queue),
          m_counters(counters),
          m_enterprise(std::move(enterprise)) {}

    int ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) override;

    /// All factories are attached. `changed` is called on the thread that tells of a change, until
    /// `stop` returns.
    void start(std::function<void()> changed);
    /// Changes are passed over from now on.
    void stop();

  private:
    enum class Phase { Starting, Running, Stopped };

    BoardManager& m_manager;
    BoardSource& m_source;
    NotificationQueue& m_queue;
    Counters& m_counters;
    Oid const m_enterprise;
    std::thread::id const m_startingThread = std::this_thread::get_id();
    std::mutex m_mutex; ///< guards what follows; held during `m_changed`
    Phase m_phase = Phase::Starting;
    std::function<void()> m_changed;
};

} // namespace kvloamd
