// SPDX-License-Identifier: BSD-2-Clause
// The parameters in the query of a target.
#pragma once

#include <charconv>
#include <initializer_list>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "agent/fronts/http/HttpFault.h"
#include "agent/fronts/http/Target.h"
#include "agent/rows/Oid.h"

namespace kvloamd {

/// The number that the whole of `text` is.
template <class Number>
std::optional<Number> numberIn(std::string_view text) {
    Number number = 0;
    auto const [end, error] = std::from_chars(text.data(), text.data() + text.size(), number);
    if (error != std::errc() || end != text.data() + text.size()) return std::nullopt;
    return number;
}

/// A relative name such as "1000.5"; nothing when `text` is none.
std::optional<Oid> indexIn(std::string_view text);

/// Throws HttpFault when `target` has a parameter that the address does not know, which is misspelt
/// as likely as not.
void checkParameters(Target const& target, std::initializer_list<std::string_view> known);

/// The words of a parameter between commas; none when it is not there.
std::vector<std::string> wordsParameter(Target const& target, std::string const& name);

/// A parameter that is a number from `lowest` to `highest`; nothing when it is not there.
/// Throws HttpFault when it is another text.
template <class Number>
std::optional<Number> numberParameter(Target const& target, std::string const& name, Number lowest,
                                      Number highest) {
    std::string const* const asked = target.parameter(name);
    if (asked == nullptr) return std::nullopt;
    auto const number = numberIn<Number>(*asked);
    if (!number || *number < lowest || *number > highest)
        throw HttpFault(400, "'" + name + "' is not a number from " + std::to_string(lowest) +
                                 " to " + std::to_string(highest));
    return number;
}

} // namespace kvloamd
