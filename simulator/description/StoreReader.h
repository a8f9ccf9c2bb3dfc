// SPDX-License-Identifier: BSD-2-Clause
// Reads the part "store" of a chassis and the fields of records.
#pragma once

#include <string_view>

#include "simulator/chassis/Chassis.h"
#include "simulator/chassis/StoreDraft.h"
#include "simulator/description/Description.h"

namespace kvlsim {

/// Both throw ChassisError. `fields` is a map "name: value"; SerialNumber is not among them.
StoreDraft readStore(Description const& store);
FieldValues readFields(Description const& fields);
/// What cannot be a family's name or a serial number.
void refuseUnfitFamily(std::string_view name, int line);
void refuseUnfitSerial(std::string_view serial, int line);

/// Refuses described boards that belong to no family of the store; throws ChassisError.
void refuseHomelessBoards(StoreDraft const& store, Chassis const& chassis);

} // namespace kvlsim
