// SPDX-License-Identifier: BSD-2-Clause
// Receives the status changes of DS1 lines.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <utility>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/readers/ChangeTimes.h"
#include "agent/readers/PlacedLine.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/Rows.h"
#include "agent/rows/Settings.h"
#include "board/BoardManager.h"
#include "board/DS1LineFeature.h"

namespace kvloamd {

/// A `LineListener` queues line status changes for the SNMP thread, one notification for each
/// change of a line whose notifications are enabled. A change of a line that has no ifIndex yet
/// waits until the next refresh has given it one.
///
/// Never destroyed: features keep plain pointers to their listeners and cannot remove one.
/// Thread-safe, apart from `listen` and `place`.
class LineListener final : public DS1LineStatusListener {
  public:
    /// All arguments live as long as the process.
    LineListener(BoardManager& manager, Settings const& settings, NotificationQueue& queue,
                 Counters& counters)
        : m_manager(manager), m_settings(settings), m_queue(queue), m_counters(counters) {}

    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override;

    /// Receives every status change of a line that has an ifIndex, with the new dsx1LineStatus, on
    /// the thread that reported it or the collector's. Called under the listener's lock: it must
    /// not call the listener.
    using Observer = std::function<void(std::uint32_t ifIndex, int status)>;
    /// Before `listen`.
    void observe(Observer observer) { m_observer = std::move(observer); }

    // Called before and after every refresh of the lines. Thread-bound: the collector.

    /// Subscribes to the line features of `boards` to which it is not subscribed yet. `times`
    /// outlives the process's last line event.
    void listen(Rows<BoardRow> const& boards, ChangeTimes& times);
    /// Takes over the ifIndex of every line, and queues the changes that waited for one.
    void place(std::vector<PlacedLine> const& lines);

    /// From now on calls `changed` after each change, on the thread that reported it.
    void start(std::function<void()> changed);
    /// From now on changes are ignored. `changed` is not called any more when this returns.
    void stop();

  private:
    struct Change {
        ReferenceCounter<DS1LineDevice> line;
        int status;
        long lastChange; ///< seconds since the epoch; negative: not known
        int enable;      ///< the line's own dsx1LineStatusChangeTrapEnable
        Clock::time_point when;
    };
    static constexpr std::size_t kMostWaiting = 4096;

    void enqueue(std::uint32_t ifIndex, Change const& change);

    BoardManager& m_manager;
    Settings const& m_settings;
    NotificationQueue& m_queue;
    Counters& m_counters;
    Observer m_observer; ///< may be empty
    /// The features to which it is subscribed. The handles keep the addresses from being reused for
    /// new features, which have no subscription. Of the collector.
    std::map<DS1LineFeature const*, ReferenceCounter<DS1LineFeature>> m_features;

    std::mutex
        m_mutex; ///< guards what follows; held during `m_changed`, never while a line is asked
    /// The lines of the latest refresh. The handles keep the addresses from being reused for new
    /// lines, which may have another ifIndex.
    std::map<DS1LineDevice const*, PlacedLine> m_places;
    std::vector<Change> m_waiting;
    ChangeTimes* m_times = nullptr; ///< set by `listen`
    std::function<void()> m_changed;
    bool m_stopped = false;
};

/// Passes the settings of `lines` on to the line objects.
void applySettings(Settings const& settings, std::vector<PlacedLine> const& lines);

} // namespace kvloamd
