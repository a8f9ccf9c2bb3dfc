// SPDX-License-Identifier: BSD-2-Clause
// Where notifications leave the agent.
#pragma once

#include <functional>

#include "agent/notifications/Notification.h"

namespace kvloamd {

/// Used on the thread that does all SNMP only.
class NotificationSink {
  public:
    virtual ~NotificationSink() = default;

    /// Whether a notification may be sent now.
    virtual bool ready() const = 0;
    /// Sends. `taken` is called once somebody else answers for the notification, at once or later;
    /// never, when the way is lost meanwhile: then it is to be sent again.
    virtual void send(Notification const& notification, std::function<void()> taken) = 0;
};

} // namespace kvloamd
