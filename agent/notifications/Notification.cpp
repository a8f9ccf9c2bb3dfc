// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notification.h"

#include <utility>

#include "agent/objects/OwnObjects.h"

namespace kvloamd {

namespace {

/// An object that is sent only.
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

Notification boardStatusChange(Oid const& enterprise, int boardIndex, std::string serialNumber,
                               int status) {
    return {joined(enterprise, kBoardStatusChangePlace),
            {sent(enterprise, 1, boardIndex), sent(enterprise, 2, std::move(serialNumber)),
             sent(enterprise, 3, status)},
            Clock::now()};
}

Notification faultChange(Oid const& enterprise, FaultNews const& news) {
    return {joined(enterprise, news.raised ? kFaultRaisedPlace : kFaultClearedPlace),
            {sent(enterprise, 1, news.boardIndex), sent(enterprise, 2, news.serialNumber),
             sent(enterprise, 4, ValueType::Gauge, std::int64_t{news.value}),
             sent(enterprise, 5, news.platformBoard)},
            Clock::now()};
}

} // namespace kvloamd
