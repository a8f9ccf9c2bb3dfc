// SPDX-License-Identifier: BSD-2-Clause
// Reads the line of a device from its description.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

#include "simulator/chassis/AttributeValue.h"
#include "simulator/chassis/LineDraft.h"
#include "simulator/description/Description.h"

namespace kvlsim {

/// All functions throw ChassisError. `of` is the device, for messages: "device 101".
LineDraft readLine(Description const& line, std::string const& of);
/// A map "name: errors per second"; other rates stay as they are in `rates`.
void readLineRates(Description const& errors, LineRates& rates);
/// A map "name: number".
LineErrors readLineErrors(Description const& errors);
/// The bit of an alarm.
std::uint32_t lineAlarmNamed(std::string_view name, int line);
/// The value that the attribute LINE_TYPE may have beside a line: a type, or an answer without
/// bytes.
bool fitsLineType(AttributeValue const& value);

} // namespace kvlsim
