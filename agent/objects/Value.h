// SPDX-License-Identifier: BSD-2-Clause
// What a managed object's value is, independent of any protocol.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <variant>

#include "agent/rows/Oid.h"

namespace kvloamd {

enum class ValueType {
    Integer,   ///< signed, 32 bits
    Counter,   ///< 32 bits, wraps
    Counter64, ///< 64 bits
    Gauge,     ///< unsigned, 32 bits
    TimeTicks, ///< a duration in hundredths of a second
    TimeStamp, ///< sysUpTime at some event; described as a time since the agent's start
    /// The same for what began at the agent's start, which is described as 0. If sysUpTime began
    /// earlier, as beside a master that ran before the agent, that start is an event too.
    BeginStamp,
    Text,     ///< printable characters
    Octets,   ///< any
    Date,     ///< 11 octets: date, time of day, offset from UTC
    ObjectId, ///< a place in the tree of names, absolute
};

/// A name that is a value.
struct NameView {
    OidView name;

    friend bool operator==(NameView const& a, NameView const& b) {
        return std::is_eq(compare(a.name, b.name));
    }
};

/// A number (an unsigned one of 64 bits as the same bits), octets or a name that the snapshot
/// holds, octets that the value itself holds, or nothing if the value is not known.
using Value = std::variant<std::monostate, std::int64_t, std::string_view, NameView, std::string>;

/// The octets of a value that has some; valid as long as the value.
inline std::optional<std::string_view> octetsOf(Value const& value) {
    if (auto const* const view = std::get_if<std::string_view>(&value)) return *view;
    if (auto const* const own = std::get_if<std::string>(&value)) return *own;
    return std::nullopt;
}

inline bool isKnown(Value const& value) {
    return !std::holds_alternative<std::monostate>(value);
}

} // namespace kvloamd
