// SPDX-License-Identifier: BSD-2-Clause
// Checks that all readers of descriptions share.
#pragma once

#include <span>
#include <string>
#include <string_view>

#include "simulator/description/Description.h"

namespace kvlsim {

/// Throw ChassisError for a node that is no map, and for a key that is not among the known ones.
void requireMap(Description const& node, std::string const& what, char const* begin);
void refuseUnknownKeys(Description const& map, std::string const& what,
                       std::span<std::string_view const> known);
/// Finds every such key.
void findUnknownKeys(Description const& map, std::string const& what,
                     std::span<std::string_view const> known, Findings& findings);

} // namespace kvlsim
