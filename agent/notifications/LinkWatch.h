// SPDX-License-Identifier: BSD-2-Clause
// Queues linkUp and linkDown notifications.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Rows.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// A `LinkWatch` compares the interfaces of each snapshot with those of the one before and queues
/// linkDown when an interface has become down, linkUp when it was down, if its
/// ifLinkUpDownTrapEnable is enabled. lowerLayerDown counts as down. An interface that appears,
/// disappears or returns with its board has not changed; nor has one whose state is or was
/// notPresent. The notification of a line carries the time at which the line became available or
/// unavailable, which is certain only some seconds later. Thread-bound: the collector.
class LinkWatch {
  public:
    /// All arguments outlive the watch.
    LinkWatch(Settings const& settings, NotificationQueue& queue, Counters const& counters)
        : m_settings(settings), m_queue(queue), m_counters(counters) {}

    /// Compares with the interfaces of a snapshot that was begun at `begun`, ascending by index.
    void update(Rows<InterfaceRow> const& interfaces, Clock::time_point begun);

  private:
    struct Link {
        std::uint32_t ifIndex;
        std::uint32_t boardIndex; ///< a board that returns has another one
        std::optional<int> operStatus;
    };

    Notification changeOf(InterfaceRow const& row, Clock::time_point begun) const;
    bool isEnabled(InterfaceRow const& row) const;

    Settings const& m_settings;
    NotificationQueue& m_queue;
    Counters const& m_counters;
    std::vector<Link> m_links; ///< of the previous snapshot, ascending by index
};

} // namespace kvloamd
