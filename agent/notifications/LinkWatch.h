// SPDX-License-Identifier: BSD-2-Clause
// Notices links that go up and down.
#pragma once

#include <cstdint>
#include <optional>
#include <vector>

#include "agent/notifications/NotificationQueue.h"
#include "agent/rows/InterfaceRows.h"
#include "agent/rows/Settings.h"

namespace kvloamd {

/// Compares the interfaces of each snapshot with those of the one before: linkDown when one has
/// become down, linkUp when one was down, where that is enabled. An interface that comes or goes,
/// or has come back with its board, is no link that changes; nor is one that is not present or
/// whose state is not known. Belongs to one thread.
class LinkWatch {
  public:
    /// `settings` and `queue` outlive the watch.
    LinkWatch(Settings const& settings, NotificationQueue& queue)
        : m_settings(settings), m_queue(queue) {}

    /// The interfaces of a snapshot begun at `begun`, ascending by index.
    void note(std::vector<InterfaceRow> const& interfaces, Clock::time_point begun);

  private:
    struct Link {
        std::uint32_t ifIndex;
        std::uint32_t boardIndex; ///< a board that comes back has another
        std::optional<int> operStatus;
    };

    bool isEnabled(InterfaceRow const& row) const;

    Settings const& m_settings;
    NotificationQueue& m_queue;
    std::vector<Link> m_links; ///< of the snapshot before, ascending by index
};

} // namespace kvloamd
