// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notifier.h"

namespace kvloamd {

std::optional<Clock::time_point> Notifier::send(Clock::time_point snapshotBegun) {
    while (auto oldest = m_queue.oldest()) {
        if (!m_sink.ready()) return std::nullopt;
        if (oldest->when > snapshotBegun && Clock::now() < oldest->when + kPatience)
            return oldest->when + kPatience;
        handOver(*oldest);
    }
    return std::nullopt;
}

bool Notifier::sendAll() {
    while (auto oldest = m_queue.oldest()) {
        if (!m_sink.ready()) return false;
        handOver(*oldest);
    }
    return true;
}

void Notifier::handOver(Notification& notification) {
    m_complete(notification);
    m_sink.send(notification, [this](Delivery delivery) { m_queue.pop(delivery); });
}

} // namespace kvloamd
