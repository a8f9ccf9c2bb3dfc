// SPDX-License-Identifier: BSD-2-Clause
// Queues linkUp and linkDown notifications.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// A `LinkWatch` compares the interfaces of each snapshot with those of the one before and queues
/// linkDown when an interface has become down, linkUp when it was down, if its
/// ifLinkUpDownTrapEnable is enabled. An interface that appears, disappears or returns with its
/// board has not changed; nor has one whose state is notPresent or not known. Thread-bound: the
/// collector.
class LinkWatch {
  public:
    /// `settings` and `queue` outlive the watch.
    LinkWatch(Settings const& settings, NotificationQueue& queue)
        : m_settings(settings), m_queue(queue) {}

    /// Compares with the interfaces of a snapshot that was begun at `begun`, ascending by index.
    void update(std::vector<InterfaceRow> const& interfaces, Clock::time_point begun);

  private:
    struct Link {
        std::uint32_t ifIndex;
        std::uint32_t boardIndex; ///< a board that returns has another one
        std::optional<int> operStatus;
    };

    bool isEnabled(InterfaceRow const& row) const;

    Settings const& m_settings;
    NotificationQueue& m_queue;
    std::vector<Link> m_links; ///< of the previous snapshot, ascending by index
};

} // namespace kvloamd
