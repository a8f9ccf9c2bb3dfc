// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notification.h"

#include <utility>

#include "agent/objects/OwnObjects.h"

namespace kvloamd {

namespace {

/// An object that is accessible-for-notify.
NotifiedObject sent(Oid const& enterprise, std::uint32_t number, ValueType type,
                    decltype(NotifiedObject::value) value) {
    return {joined(enterprise, joined(kNotifyObjectsPlace, Oid{number, 0})), type,
            std::move(value)};
}

NotifiedObject sent(Oid const& enterprise, std::uint32_t number, std::int64_t value) {
    return sent(enterprise, number, ValueType::Integer, value);
}

NotifiedObject sent(Oid const& enterprise, std::uint32_t number, std::string value) {
    return sent(enterprise, number, ValueType::Text, std::move(value));
}

} // namespace

Value NotifiedObject::view() const {
    if (auto const* const number = std::get_if<std::int64_t>(&value)) return *number;
    if (auto const* const octets = std::get_if<std::string>(&value))
        return std::string_view(*octets);
    return NameView{std::get<Oid>(value)};
}

Notification boardStatusNotification(Oid const& enterprise, int boardIndex,
                                     std::string serialNumber, int status) {
    return {joined(enterprise, kBoardStatusChangePlace),
            {sent(enterprise, 1, boardIndex), sent(enterprise, 2, std::move(serialNumber)),
             sent(enterprise, 3, status)},
            Clock::now(),
            {.boardIndex = static_cast<std::uint32_t>(boardIndex)}};
}

Notification faultNotification(Oid const& enterprise, FaultChange const& change) {
    return {joined(enterprise, change.raised ? kFaultRaisedPlace : kFaultClearedPlace),
            {sent(enterprise, 1, change.boardIndex), sent(enterprise, 2, change.serialNumber),
             sent(enterprise, 4, ValueType::Gauge, std::int64_t{change.value}),
             sent(enterprise, 5, change.platformBoard),
             sent(enterprise, 6, faultKind(change.value))},
            Clock::now(),
            {.boardIndex = static_cast<std::uint32_t>(change.boardIndex)}};
}

} // namespace kvloamd
