// SPDX-License-Identifier: BSD-2-Clause
// Sends notifications to the receivers that the SNMP library's configuration names.
#pragma once

#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// Used while the library is started only.
class SnmpNotifications final : public NotificationSink {
  public:
    /// Announces that the agent has started.
    static void sendStart();

    bool ready() const override { return true; }
    void send(Notification const& notification, std::function<void()> taken) override;
};

} // namespace kvloamd
