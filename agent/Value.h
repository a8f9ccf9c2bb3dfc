// SPDX-License-Identifier: BSD-2-Clause
// What a managed object's value is, independent of any protocol.
#pragma once

#include <compare>
#include <cstdint>
#include <span>
#include <string_view>
#include <variant>
#include <vector>

namespace kvloamd {

/// An object's place in the tree of names. Whoever says "relative" leaves out the arc above
/// all objects of its tree.
using Oid = std::vector<std::uint32_t>;
using OidView = std::span<std::uint32_t const>;

/// Lexicographic order, which is the order of every walk.
inline std::strong_ordering compare(OidView a, OidView b) {
    for (std::size_t i = 0; i < a.size() && i < b.size(); ++i)
        if (auto const order = a[i] <=> b[i]; std::is_neq(order)) return order;
    return a.size() <=> b.size();
}

inline bool startsWith(OidView name, OidView prefix) {
    return name.size() >= prefix.size() && std::is_eq(compare(name.first(prefix.size()), prefix));
}

/// One name after the other.
inline Oid joined(OidView a, OidView b) {
    Oid name(a.begin(), a.end());
    name.insert(name.end(), b.begin(), b.end());
    return name;
}

enum class ValueType {
    Integer,   ///< signed, 32 bits
    Counter,   ///< 32 bits, wraps
    Counter64, ///< 64 bits
    Gauge,     ///< unsigned, 32 bits
    TimeTicks, ///< hundredths of a second since the agent's start
    Text,      ///< printable characters
    Octets,    ///< any
    Date,      ///< 11 octets: date, time of day, offset from UTC
    ObjectId,  ///< a place in the tree of names, absolute
};

/// A name that is a value.
struct NameView {
    OidView name;

    friend bool operator==(NameView const& a, NameView const& b) {
        return std::is_eq(compare(a.name, b.name));
    }
};

/// A number (an unsigned one of 64 bits as the same bits), octets or a name that the snapshot
/// behind them holds, or nothing: the value is not known.
using Value = std::variant<std::monostate, std::int64_t, std::string_view, NameView>;

inline bool isKnown(Value const& value) {
    return !std::holds_alternative<std::monostate>(value);
}

} // namespace kvloamd
