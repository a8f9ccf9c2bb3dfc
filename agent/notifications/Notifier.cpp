// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notifier.h"

namespace kvloamd {

std::optional<Clock::time_point> Notifier::announce(Clock::time_point snapshotBegun) {
    while (auto const oldest = m_queue.oldest()) {
        if (!m_sink.ready()) return std::nullopt;
        if (oldest->when > snapshotBegun && Clock::now() < oldest->when + kPatience)
            return oldest->when + kPatience;
        send(*oldest);
    }
    return std::nullopt;
}

bool Notifier::announceAll() {
    while (auto const oldest = m_queue.oldest()) {
        if (!m_sink.ready()) return false;
        send(*oldest);
    }
    return true;
}

void Notifier::send(Notification const& notification) {
    m_sink.send(notification, [this] { m_queue.pop(); });
}

} // namespace kvloamd
