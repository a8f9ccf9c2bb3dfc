// SPDX-License-Identifier: BSD-2-Clause
// The attributes of an object as it is described, found by name.
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>
#include <unordered_map>

#include "simulator/chassis/AttributeValue.h"

namespace kvlsim {

/// `TextHash` is a hash that lets maps be searched with a text that is not a std::string.
struct TextHash {
    using is_transparent = void;
    std::size_t operator()(std::string_view text) const noexcept {
        return std::hash<std::string_view>()(text);
    }
};

using AttributeMap = std::unordered_map<std::string, AttributeValue, TextHash, std::equal_to<>>;

} // namespace kvlsim
