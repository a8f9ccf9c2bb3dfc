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
    explicit SnmpNotifications(Receivers& receivers) : m_receivers(receivers) {}

    bool ready() const override { return m_receivers.isSettled(); }
    /// A notification counts as dropped while a receiver is not open, or if too many informs wait
    /// to be acknowledged.
    void send(Notification const& notification, Delivered delivered) override;

  private:
    Receivers& m_receivers;
};

} // namespace kvloamd
