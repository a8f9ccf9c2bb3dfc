// SPDX-License-Identifier: BSD-2-Clause
#include "agent/Notification.h"

#include <utility>

#include "agent/Objects.h"

namespace kvloamd {

Value NotifiedObject::view() const {
    if (auto const* const number = std::get_if<std::int64_t>(&value)) return *number;
    if (auto const* const octets = std::get_if<std::string>(&value))
        return std::string_view(*octets);
    return NameView{std::get<Oid>(value)};
}

Notification boardStatusChange(Oid const& enterprise, int boardIndex, std::string serialNumber,
                               int status) {
    auto const object = [&](std::uint32_t number) {
        return joined(enterprise, joined(kNotifyObjectsPlace, Oid{number, 0}));
    };
    return {joined(enterprise, kBoardStatusChangePlace),
            {{object(1), ValueType::Integer, std::int64_t{boardIndex}},
             {object(2), ValueType::Text, std::move(serialNumber)},
             {object(3), ValueType::Integer, std::int64_t{status}}},
            Clock::now()};
}

} // namespace kvloamd
