// SPDX-License-Identifier: BSD-2-Clause
// Reads attributes from their description.
#pragma once

#include <string_view>

#include "simulator/chassis/AttributeMap.h"
#include "simulator/description/Description.h"
#include "simulator/description/Findings.h"

namespace kvlsim {

/// All functions throw ChassisError.
/// The attributes of an object of any kind, as a map "name: value".
AttributeMap readAttributes(Description const& attributes);
/// The same, with one finding per wrong attribute, and a warning for an unknown name that is close
/// to a known one.
AttributeMap readAttributes(Description const& attributes, Findings& findings);
AttributeValue readAttribute(std::string_view name, Description const& value);
/// Refuse a text that cannot be an attribute's name or value.
void refuseUnfitName(std::string_view name, int line);
void refuseUnfitText(std::string_view name, std::string_view text, int line);

} // namespace kvlsim
