// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/Notification.h"

#include <utility>

#include "agent/objects/OwnObjects.h"

namespace kvloamd {

namespace {

Oid const kColdStart{1, 3, 6, 1, 6, 3, 1, 1, 5, 1};
/// kvlEventNumber.0, relative.
Oid const kEventNumber{1, 1, 12, 5, 0};

/// Absolute, or relative to the enterprise arc.
std::pair<Oid, char const*> const kNames[] = {
    {kColdStart, "coldStart"},
    {{1, 3, 6, 1, 6, 3, 1, 1, 5, 3}, "linkDown"},
    {{1, 3, 6, 1, 6, 3, 1, 1, 5, 4}, "linkUp"},
    {{1, 3, 6, 1, 2, 1, 10, 18, 15, 0, 1}, "dsx1LineStatusChange"},
    {{1, 3, 6, 1, 2, 1, 10, 20, 2, 0, 1}, "isdnMibCallInformation"},
    {{1, 3, 6, 1, 2, 1, 47, 2, 0, 1}, "entConfigChange"},
    {{1, 3, 6, 1, 2, 1, 131, 0, 1}, "entStateOperEnabled"},
    {{1, 3, 6, 1, 2, 1, 131, 0, 2}, "entStateOperDisabled"},
    {kBoardStatusChangePlace, "kvlBoardStatusChange"},
    {kFaultRaisedPlace, "kvlFaultRaised"},
    {kFaultClearedPlace, "kvlFaultCleared"},
};

VariableType variableType(ValueType type) {
    switch (type) {
    case ValueType::Integer:
        return VariableType::Integer32;
    case ValueType::Counter:
        return VariableType::Counter32;
    case ValueType::Counter64:
        return VariableType::Counter64;
    case ValueType::Gauge:
        return VariableType::Unsigned32;
    case ValueType::TimeTicks:
    case ValueType::TimeStamp:
    case ValueType::BeginStamp:
        return VariableType::TimeTicks;
    case ValueType::ObjectId:
        return VariableType::ObjectId;
    case ValueType::Text:
    case ValueType::Octets:
    case ValueType::Date:
        break;
    }
    return VariableType::OctetString;
}

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

Notification startNotification() {
    // It waits for no snapshot.
    return {kColdStart, {}, Clock::time_point::min()};
}

Oid eventNumberName(Oid const& enterprise) {
    return joined(enterprise, kEventNumber);
}

LoggedNotification logged(Notification const& notification) {
    LoggedNotification log{notification.name, {}};
    for (NotifiedObject const& object : notification.objects)
        log.variables.push_back({object.name, variableType(object.type), object.value});
    return log;
}

std::string notificationName(Oid const& enterprise, Oid const& name) {
    for (auto const& [known, text] : kNames)
        if (name == known || name == joined(enterprise, known)) return text;
    std::string numbers;
    for (std::uint32_t const part : name)
        numbers += (numbers.empty() ? "" : ".") + std::to_string(part);
    return numbers;
}

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
