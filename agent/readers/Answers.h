// SPDX-License-Identifier: BSD-2-Clause
// Turns the answers of the library into the fields of rows.
#pragma once

#include <cstddef>
#include <limits>
#include <optional>
#include <string>
#include <string_view>

#include "board/Interface.h"

namespace kvloamd {

/// The longest text that is served; longer ones are cut.
inline constexpr std::size_t kLongestText = 255;

/// `text` as it is served: what is not printable ASCII becomes '?', what is too long is cut.
std::string printable(std::string_view text);

/// Texts of the model have 256 bytes at most; a concrete class may answer longer ones.
inline constexpr std::size_t kTextCapacity = 4096;

/// The text that `query` of `asked` answers, as it is served; empty if it is not supported.
template <class Asked>
std::string askText(Asked& asked, int (Asked::*query)(char*)) {
    char answer[kTextCapacity];
    answer[0] = '\0';
    answer[kTextCapacity - 1] = '\0';
    if ((asked.*query)(answer) == KVL::kNotSupported) return {};
    return printable(answer);
}

/// Seconds since the epoch as the 11 octets of a date with its offset from UTC, in local time;
/// empty for 0 or less, which is an unknown date, and for years that have no four digits.
std::string dateOctets(long seconds);

/// "0xd0000000"; empty for -1, which is an unknown address. The platform's addresses have four
/// bytes and arrive sign-extended, so other negative numbers are read as those four bytes.
std::string addressText(long address);

/// `number` unless it is negative, which is how the library says that it is not known.
template <class Number>
std::optional<int> unlessNegative(Number number) {
    if (number < 0 || number > std::numeric_limits<int>::max()) return std::nullopt;
    return static_cast<int>(number);
}

} // namespace kvloamd
