// SPDX-License-Identifier: BSD-2-Clause
// Keeps a snapshot of all rows, made on a thread of its own.
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
    std::chrono::milliseconds requestAge{1000}; ///< older ones are renewed when one is asked for
    std::chrono::milliseconds eventPause{100};  ///< at least, between two that events ask for
    std::chrono::milliseconds idle{10000};      ///< at least one in this time, asked for or not
};

/// Whoever asks gets the newest snapshot at once and never waits for the boards; an old one is
/// renewed behind the asker's back. All operations may be called from any thread.
class Collector {
  public:
    /// Fills the rows of a new snapshot. Called on the collector's thread only.
    using ReadRows = std::function<void(Snapshot&)>;

    /// Starts the collector's thread and waits for the first snapshot; rethrows what reading it
    /// throws. `started`: the agent's start, from which times of change count. `renewed` is called
    /// on the collector's thread after every later snapshot.
    Collector(ReadRows readRows, Clock::time_point started, std::function<void()> renewed,
              CollectorPace pace = {});
    /// Ends the thread; a reading under way is waited for.
    ~Collector();
    Collector(Collector const&) = delete;
    Collector& operator=(Collector const&) = delete;

    /// The newest snapshot, for a request: an old one is renewed.
    std::shared_ptr<Snapshot const> snapshot();
    /// The newest snapshot, whatever its age.
    std::shared_ptr<Snapshot const> newest();
    /// Something has happened that the next snapshot is to show.
    void renew();

  private:
    void begin(std::promise<void> first);
    void run();
    std::shared_ptr<Snapshot const> collect(Snapshot const* former);

    ReadRows m_readRows;
    Uptime const m_uptime;
    std::function<void()> m_renewed;
    CollectorPace m_pace;

    std::mutex m_mutex; ///< guards what follows
    std::condition_variable m_wake;
    std::shared_ptr<Snapshot const> m_snapshot;
    bool m_requested = false;
    bool m_eventful = false;
    bool m_stop = false;

    std::thread m_thread; ///< last: it uses all of the above
};

} // namespace kvloamd
