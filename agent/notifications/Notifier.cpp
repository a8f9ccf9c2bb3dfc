// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notifier.h"

#include <utility>

namespace kvloamd {

std::optional<Clock::time_point> Notifier::send(Clock::time_point snapshotBegun) {
    for (std::size_t sent = 0; auto oldest = m_queue.oldest(); ++sent) {
        if (!m_sink.ready()) return std::nullopt;
        if (sent == kBatch) return Clock::now();
        if (oldest->when > snapshotBegun && Clock::now() < oldest->when + kPatience)
            return oldest->when + kPatience;
        handOver(std::move(*oldest));
    }
    return std::nullopt;
}

bool Notifier::sendAll() {
    while (auto oldest = m_queue.oldest()) {
        if (!m_sink.ready()) return false;
        handOver(std::move(*oldest));
    }
    return true;
}

void Notifier::handOver(Notification&& notification) {
    if (!m_current) {
        m_current = std::move(notification);
        m_complete(*m_current);
    }
    // The sink may deliver it during the call.
    Notification const sent = *m_current;
    m_sink.send(sent, [this](Delivery delivery) {
        if (delivery == Delivery::Acknowledged || delivery == Delivery::Unacknowledged)
            return m_queue.settle(delivery);
        m_current.reset();
        m_queue.pop(delivery);
    });
}

} // namespace kvloamd
