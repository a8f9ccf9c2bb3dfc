// SPDX-License-Identifier: BSD-2-Clause
// Sends notifications to the configured receivers.
#pragma once

#include "agent/fronts/snmp/Receivers.h"
#include "agent/notifications/NotificationSink.h"

namespace kvloamd {

/// `SnmpNotifications` sends notifications by the SNMP library, to the receivers of its
/// configuration. Thread-bound to the SNMP thread; used while the library is started.
class SnmpNotifications final : public NotificationSink {
  public:
    /// `receivers` outlives this object.
    explicit SnmpNotifications(Receivers const& receivers) : m_receivers(receivers) {}

    /// Sends coldStart.
    static void sendStart();

    bool ready() const override { return m_receivers.isSettled(); }
    /// A notification counts as dropped while a receiver is not open.
    void send(Notification const& notification, Delivered delivered) override;

  private:
    Receivers const& m_receivers;
};

} // namespace kvloamd
