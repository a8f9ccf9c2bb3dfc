// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Notifier.h"

#include <utility>

#include "agent/Objects.h"

namespace kvloamd {

namespace {

Oid absolute(Oid const& enterprise, Oid const& place, std::initializer_list<std::uint32_t> rest) {
    Oid name = enterprise;
    name.insert(name.end(), place.begin(), place.end());
    name.insert(name.end(), rest);
    return name;
}

} // namespace

Notifier::Notifier(StatusQueue& queue, NotificationSink& sink, Oid enterprise)
    : m_queue(queue), m_sink(sink), m_enterprise(std::move(enterprise)) {}

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

void Notifier::send(StatusChange const& change) {
    m_sink.send(notificationOf(change), [this] { m_queue.pop(); });
}

Notification Notifier::notificationOf(StatusChange const& change) const {
    auto const object = [&](std::uint32_t number) {
        return absolute(m_enterprise, kNotifyObjectsPlace, {number, 0});
    };
    return {absolute(m_enterprise, kBoardStatusChangePlace, {}),
            {{object(1), ValueType::Integer, std::int64_t{change.boardIndex}},
             {object(2), ValueType::Text, std::string_view(change.serialNumber)},
             {object(3), ValueType::Integer, std::int64_t{change.status}}}};
}

} // namespace kvloamd
