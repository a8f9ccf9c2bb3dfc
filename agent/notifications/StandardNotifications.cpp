// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/StandardNotifications.h"

#include "agent/objects/StandardObjects.h"

namespace kvloamd {

namespace {

Oid const kLinkDown{1, 3, 6, 1, 6, 3, 1, 1, 5, 3};
Oid const kLinkUp{1, 3, 6, 1, 6, 3, 1, 1, 5, 4};
Oid const kLineStatusChangePlace{10, 18, 15, 0, 1};

/// A cell of `table`.
NotifiedObject object(Table const& table, std::uint32_t column, std::uint32_t ifIndex,
                      ValueType type, std::int64_t value) {
    return {joined(kStandardArc, joined(table.entry(), Oid{column, ifIndex})), type, value};
}

} // namespace

Notification lineStatusChange(std::uint32_t ifIndex, int status, std::uint32_t lastChange,
                              Clock::time_point when) {
    return {joined(kStandardArc, kLineStatusChangePlace),
            {object(dsx1ConfigTable(), 10, ifIndex, ValueType::Integer, status),
             object(dsx1ConfigTable(), 16, ifIndex, ValueType::TimeTicks, lastChange)},
            when,
            {.ifIndex = ifIndex}};
}

Notification linkChange(InterfaceRow const& row, Clock::time_point when) {
    int const operStatus = row.operStatus.value_or(int{kUp});
    // The notification requires all three objects. An interface without ifAdminStatus cannot be
    // taken down, so it is administratively up.
    return {
        operStatus == kDown ? kLinkDown : kLinkUp,
        {object(ifTable(), 1, row.ifIndex, ValueType::Integer, row.ifIndex),
         object(ifTable(), 7, row.ifIndex, ValueType::Integer, row.adminStatus.value_or(int{kUp})),
         object(ifTable(), 8, row.ifIndex, ValueType::Integer, operStatus)},
        when,
        {.ifIndex = row.ifIndex}};
}

} // namespace kvloamd
