// SPDX-License-Identifier: BSD-2-Clause
// Reads a chassis, a board or one attribute from its description and refuses what is wrong.
#pragma once

#include <span>
#include <string>
#include <string_view>

#include "simulator/Chassis.h"
#include "simulator/Description.h"

namespace kvlsim {

/// All throw ChassisError with the line and a message that says what to do.
Chassis readChassis(std::string const& yamlText);
/// Defaults (condition, presence, date) included.
ObjectDraft readBoard(Description const& description);
/// The attributes of an object of any kind, as a map "name: value".
AttributeMap readAttributes(Description const& attributes);
AttributeValue readAttribute(std::string_view name, Description const& value);
/// What cannot be an attribute's name or text.
void refuseUnfitName(std::string_view name, int line);
void refuseUnfitText(std::string_view name, std::string_view text, int line);

/// Throw ChassisError for a node that is no map, and for keys that are not among the known ones.
void requireMap(Description const& node, std::string const& what, char const* begin);
void refuseUnknownKeys(Description const& map, std::string const& what,
                       std::span<std::string_view const> known);

/// Reads a file; throws ChassisError (without line) when it cannot be read.
std::string readChassisFile(std::string const& path);

/// Now, in the format of STATE_CHANGE_DATE, local time.
std::string currentDate();

} // namespace kvlsim
