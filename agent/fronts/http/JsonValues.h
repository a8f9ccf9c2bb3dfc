// SPDX-License-Identifier: BSD-2-Clause
// Described objects as JSON: keys and values.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "agent/fronts/http/JsonWriter.h"
#include "agent/objects/Description.h"

namespace kvloamd {

/// For whom values are written.
enum class Manner {
    Module, ///< for programs that know the MIB modules: their names and units
    People  ///< short keys; times since the agent's start in seconds
};

/// The key of the column `name` in a table whose columns' names all begin with `prefix`. The key
/// lacks the prefix and begins with a small letter, as kvlBoardSerialNumber becomes serialNumber.
/// A word in capitals that it begins with becomes small as a whole, without the s of a plural:
/// dsx1CurrentESs becomes es. Times since the agent's start and durations end in Seconds.
std::string keyOf(std::string_view name, std::string_view prefix, ValueType type);

/// Writes the value of an object of this type. Names replace the numbers of an enumeration; a
/// truth value is true or false; a sum of bits and a set are lists of names; dates are RFC 3339 in
/// UTC; octets that are no text are pairs of hexadecimal digits; what is not known is null.
void writeValue(JsonWriter& json, ValueType type, Details const& details, Value const& value,
                Counters const& counters, Manner manner);

/// A name as "1.3.6.1".
std::string dotted(OidView name);

/// A date of 8 or 11 octets in the form of RFC 3339, in UTC; nothing when it is none.
std::optional<std::string> rfc3339(std::string_view octets);
/// The same for milliseconds since the epoch.
std::string rfc3339(std::int64_t milliseconds);

} // namespace kvloamd
