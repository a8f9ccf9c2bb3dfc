// SPDX-License-Identifier: BSD-2-Clause
// Takes the lines' status changes off the threads that tell of them.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <utility>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/readers/PlacedLine.h"
#include "agent/rows/BoardRow.h"
#include "agent/rows/Settings.h"
#include "agent/rows/Uptime.h"
#include "board/BoardManager.h"
#include "board/DS1LineFeature.h"

namespace kvloamd {

/// Listens at the line features of all boards. Each change, of a line for which that is enabled,
/// is queued with what it was at that time, however soon the next one follows. A change of a line
/// that has no index yet waits for the end of the reading that is to give it one.
///
/// Features keep plain pointers to their listeners and have no way to take one out, so it is never
/// destroyed.
class LineListener final : public DS1LineStatusListener {
  public:
    /// All arguments live as long as the process.
    LineListener(BoardManager& manager, Settings const& settings, NotificationQueue& queue,
                 Counters& counters)
        : m_manager(manager), m_settings(settings), m_queue(queue), m_counters(counters) {}

    int ProcessLineStatusEvent(ReferenceCounter<DS1LineStatusEvent> event) override;

    // Around every reading of the lines, on the thread that reads them.

    /// The boards whose lines will be read: listens where it does not yet.
    void listen(std::vector<BoardRow> const& boards, Uptime const& uptime);
    /// All lines that have been read.
    void place(std::vector<PlacedLine> const& lines);

    /// `changed` is called on the thread that tells of a change, until `stop` returns.
    void start(std::function<void()> changed);
    /// Changes are passed over from now on.
    void stop();

  private:
    struct Change {
        ReferenceCounter<DS1LineDevice> line;
        int status;
        long lastChange; ///< seconds since the epoch; negative: not known
        int enable;      ///< as the line says
        Clock::time_point when;
    };
    static constexpr std::size_t kMostWaiting = 4096;

    void announce(std::uint32_t ifIndex, Change const& change);

    BoardManager& m_manager;
    Settings const& m_settings;
    NotificationQueue& m_queue;
    Counters& m_counters;
    /// Where it listens, by board index: a feature of a board that is there stays where it is. Of
    /// the thread that reads the lines.
    std::set<std::pair<std::uint32_t, DS1LineFeature const*>> m_features;

    std::mutex
        m_mutex; ///< guards what follows; held during `m_changed`, never while a line is asked
    std::map<DS1LineDevice const*, std::uint32_t> m_places; ///< of the reading before
    std::vector<Change> m_waiting;
    std::optional<Uptime> m_uptime;
    std::function<void()> m_changed;
    bool m_stopped = false;
};

/// Has the lines know what is set for them.
void handOn(Settings const& settings, std::vector<PlacedLine> const& lines);

} // namespace kvloamd
