// SPDX-License-Identifier: BSD-2-Clause
// The interface through which notifications leave the agent.
#pragma once

#include <functional>

#include "agent/notifications/Notification.h"

namespace kvloamd {

using Delivered = std::function<void(Delivery)>;

/// A `NotificationSink` takes notifications. Thread-bound: the SNMP thread.
class NotificationSink {
  public:
    virtual ~NotificationSink() = default;

    /// Whether `send` may be called now.
    virtual bool ready() const = 0;
    /// Sends a notification. Calls `delivered`, during this call or later, when the notification
    /// has been handed over, or given up, and is not to be sent again; if it is awaited then, calls
    /// it once more, later. If the connection is lost before, `delivered` is never called, and the
    /// caller sends the notification again.
    virtual void send(Notification const& notification, Delivered delivered) = 0;
};

} // namespace kvloamd
