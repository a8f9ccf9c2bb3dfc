// SPDX-License-Identifier: BSD-2-Clause
// Reads a chassis, a board or one attribute from its description and refuses faulty ones.
#pragma once

#include <optional>
#include <string>

#include "simulator/chassis/Chassis.h"
#include "simulator/description/Description.h"
#include "simulator/description/Findings.h"

namespace kvlsim {

/// Reads a chassis and finds what is wrong with it. Empty: errors are collected.
std::optional<Chassis> readChassis(std::string const& yamlText, Findings& findings);
Chassis readChassis(Description const& file, Findings& findings);
/// Likewise a board, with defaults (condition, presence, date). Empty: errors are collected.
std::optional<ObjectDraft> readBoard(Description const& description, Findings& findings);
/// The others throw ChassisError with the line and a message that says what to do.
Chassis readChassis(std::string const& yamlText);
Chassis readChassis(Description const& file);
ObjectDraft readBoard(Description const& description);
/// Reads a file; throws ChassisError (without line) when it cannot be read.
std::string readChassisFile(std::string const& path);

/// The local time now, in the format of STATE_CHANGE_DATE.
std::string currentDate();

} // namespace kvlsim
