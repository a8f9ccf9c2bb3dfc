// SPDX-License-Identifier: BSD-2-Clause
// Sends notifications to the configured receivers.
#pragma once

#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// `SnmpNotifications` sends notifications by the SNMP library, to the receivers of its
/// configuration. Thread-bound to the SNMP thread; used while the library is started.
class SnmpNotifications final : public NotificationSink {
  public:
    /// Sends coldStart.
    static void sendStart();

    bool ready() const override { return true; }
    void send(Notification const& notification, Delivered delivered) override;
};

} // namespace kvloamd
