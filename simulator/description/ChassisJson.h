// SPDX-License-Identifier: BSD-2-Clause
// Objects and values as JSON, in the form of a description.
#pragma once

#include <cstdint>
#include <string_view>

#include <nlohmann/json.hpp>

#include "simulator/chassis/Chassis.h"

namespace kvlsim {

nlohmann::json toJson(std::string_view attribute, AttributeValue const& value);
/// The names of these alarms, as a list.
nlohmann::json alarmNames(std::uint32_t alarms);
/// A rate of LineRates as a number per second.
nlohmann::json perSecond(std::uint64_t rate);
/// An object with its children. A line is described as it is now; its counts are not.
nlohmann::json toJson(ChassisObject const& object, Chassis const& chassis);

} // namespace kvlsim
