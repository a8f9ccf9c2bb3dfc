// SPDX-License-Identifier: BSD-2-Clause
// Keeps a current snapshot of all rows.
#pragma once

#include <condition_variable>
#include <functional>
#include <future>
#include <memory>
#include <mutex>
#include <thread>

#include "agent/rows/Snapshot.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

/// How often snapshots are made.
struct CollectorPace {
    std::chrono::milliseconds requestAge{1000}; ///< a request refreshes an older snapshot
    std::chrono::milliseconds eventPause{100};  ///< the least time between two refreshes by events
    std::chrono::milliseconds idle{10000};      ///< the most time between two refreshes
};

/// A `Collector` holds the newest snapshot and refreshes it on a thread of its own. A request gets
/// the newest snapshot at once and never waits for the boards; an outdated snapshot is refreshed in
/// the background. A refresh that throws is logged, and the last snapshot stays. Thread-safe.
class Collector {
  public:
    /// Fills the rows of a new snapshot. Called on the collector's thread only.
    using ReadRows = std::function<void(Snapshot&)>;

    /// Starts the collector's thread and waits for the first snapshot; rethrows what reading it
    /// throws. `started`: the agent's start. `renewed` is called on the collector's thread after
    /// every later snapshot.
    Collector(ReadRows readRows, Clock::time_point started, std::function<void()> renewed,
              CollectorPace pace = {});
    /// Ends the thread, after a refresh that has begun.
    ~Collector();
    Collector(Collector const&) = delete;
    Collector& operator=(Collector const&) = delete;

    /// The newest snapshot, for a request. Starts a refresh if it is outdated.
    std::shared_ptr<Snapshot const> snapshot();
    /// The newest snapshot, whatever its age.
    std::shared_ptr<Snapshot const> newest();
    /// Starts a refresh, because something has happened.
    void renew();

  private:
    void begin(std::promise<void> first);
    void run();
    std::shared_ptr<Snapshot const> collect(Snapshot const* former);
    /// Null if reading threw, which is logged once.
    std::shared_ptr<Snapshot const> tryToCollect(Snapshot const* former);

    ReadRows m_readRows;
    Uptime const m_uptime;
    std::function<void()> m_renewed;
    CollectorPace m_pace;
    // Of the collector's thread.
    Clock::time_point m_tried; ///< when the last reading began
    bool m_failing = false;    ///< the last reading threw

    std::mutex m_mutex; ///< guards what follows
    std::condition_variable m_wake;
    std::shared_ptr<Snapshot const> m_snapshot;
    bool m_requested = false;
    bool m_eventful = false;
    bool m_stop = false;

    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
