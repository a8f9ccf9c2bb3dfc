// SPDX-License-Identifier: BSD-2-Clause
// Getters of columns: a row's field as a value, or nothing when the field is not known.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "agent/objects/Value.h"

namespace kvloamd {

/// A number that is always known.
template <auto Field, class Row>
Value plain(Row const& row) {
    return std::int64_t{row.*Field};
}

/// The same number for every row.
template <std::int64_t Number, class Row>
Value always(Row const&) {
    return Number;
}

/// The empty text for every row.
template <class Row>
Value noText(Row const&) {
    return std::string_view();
}

template <auto Field, class Row>
Value text(Row const& row) {
    return std::string_view(row.*Field);
}

/// A text or octets that are empty when they are not known.
template <auto Field, class Row>
Value textIfKnown(Row const& row) {
    return (row.*Field).empty() ? Value{} : Value{std::string_view(row.*Field)};
}

/// The low 32 bits of a row's counter, and all 64.
template <auto Counter, class Row>
Value count32(Row const& row) {
    auto const& counter = row.counters[Counter];
    return counter ? Value{std::int64_t{static_cast<std::uint32_t>(*counter)}} : Value{};
}

template <auto Counter, class Row>
Value count64(Row const& row) {
    auto const& counter = row.counters[Counter];
    return counter ? Value{static_cast<std::int64_t>(*counter)} : Value{};
}

/// A number in an `std::optional`.
template <auto Field, class Row>
Value number(Row const& row) {
    return (row.*Field).has_value() ? Value{std::int64_t{*(row.*Field)}} : Value{};
}

} // namespace kvloamd
