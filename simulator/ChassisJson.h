// SPDX-License-Identifier: BSD-2-Clause
// Objects and values as JSON, in the very form in which a description is written.
#pragma once

#include <nlohmann/json.hpp>

#include "simulator/Chassis.h"

namespace kvlsim {

nlohmann::json toJson(std::string_view attribute, AttributeValue const& value);
/// An object with its children.
nlohmann::json toJson(ChassisObject const& object, Chassis const& chassis);

} // namespace kvlsim
