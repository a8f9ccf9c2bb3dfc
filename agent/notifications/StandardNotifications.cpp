// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/StandardNotifications.h"

#include <utility>

#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

Oid const kLinkDown{1, 3, 6, 1, 6, 3, 1, 1, 5, 3};
Oid const kLinkUp{1, 3, 6, 1, 6, 3, 1, 1, 5, 4};
Oid const kLineStatusChangePlace{10, 18, 15, 0, 1};
Oid const kCallInformationPlace{10, 20, 2, 0, 1};

/// A cell of `table`.
NotifiedObject object(Table const& table, std::uint32_t column, std::uint32_t ifIndex,
                      ValueType type, decltype(NotifiedObject::value) value) {
    return {joined(kStandardArc, joined(table.entry(), Oid{column, ifIndex})), type,
            std::move(value)};
}

} // namespace

Notification lineStatusChange(std::uint32_t ifIndex, int status, std::uint32_t lastChange,
                              Clock::time_point when) {
    return {
        joined(kStandardArc, kLineStatusChangePlace),
        {object(dsx1ConfigTable(), 10, ifIndex, ValueType::Integer, std::int64_t{status}),
         object(dsx1ConfigTable(), 16, ifIndex, ValueType::TimeTicks, std::int64_t{lastChange})},
        when,
        {.ifIndex = ifIndex}};
}

Notification callInformation(BearerRow const& row, Counters const& counters,
                             Clock::time_point when) {
    CallRow const& call = row.call;
    auto const bearer = [&row](std::uint32_t column, ValueType type,
                               decltype(NotifiedObject::value) value) {
        return object(isdnBearerTable(), column, row.ifIndex, type, std::move(value));
    };
    auto const time = [&counters](std::uint32_t ticks) {
        return std::int64_t{counters.sysUpTime(ticks)};
    };
    Notification notification{
        joined(kStandardArc, kCallInformationPlace),
        {object(ifTable(), 1, row.ifIndex, ValueType::Integer, std::int64_t{row.ifIndex}),
         bearer(2, ValueType::Integer, std::int64_t{row.operStatus.value_or(1)}),
         bearer(4, ValueType::Text, call.peerAddress),
         bearer(5, ValueType::Text, call.peerSubAddress),
         bearer(9, ValueType::TimeTicks, time(call.setupTime)),
         bearer(7, ValueType::Integer, std::int64_t{call.informationType}),
         bearer(6, ValueType::Integer, std::int64_t{call.origin})},
        when,
        {.ifIndex = row.ifIndex}};
    if (call.connected)
        notification.objects.push_back(bearer(10, ValueType::TimeTicks, time(call.connectTime)));
    return notification;
}

Notification linkChange(InterfaceRow const& row, Clock::time_point when) {
    int const operStatus = row.operStatus.value_or(int{kUp});
    // The notification requires all three objects.
    return {isDown(operStatus) ? kLinkDown : kLinkUp,
            {object(ifTable(), 1, row.ifIndex, ValueType::Integer, std::int64_t{row.ifIndex}),
             object(ifTable(), 7, row.ifIndex, ValueType::Integer,
                    std::int64_t{row.adminStatus.value_or(int{kUp})}),
             object(ifTable(), 8, row.ifIndex, ValueType::Integer, std::int64_t{operStatus})},
            when,
            {.ifIndex = row.ifIndex}};
}

} // namespace kvloamd
