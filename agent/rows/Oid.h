// SPDX-License-Identifier: BSD-2-Clause
// Object identifiers: the names of managed objects.
#pragma once

#include <compare>
#include <cstdint>
#include <span>
#include <vector>

namespace kvloamd {

/// The name of an object in the tree of names. A name called "relative" omits the arc above
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

} // namespace kvloamd
