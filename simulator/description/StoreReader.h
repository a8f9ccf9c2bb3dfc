// SPDX-License-Identifier: BSD-2-Clause
// Reads the part "store" of a chassis and the fields of records.
#pragma once

#include <string_view>

#include "simulator/chassis/Chassis.h"
#include "simulator/chassis/StoreDraft.h"
#include "simulator/description/Description.h"

namespace kvlsim {

/// Both throw ChassisError. A wrong record of the store is a finding. `fields` is a map "name:
/// value"; SerialNumber is not among them.
StoreDraft readStore(Description const& store, Findings& findings);
FieldValues readFields(Description const& fields);
/// Refuse a text that cannot be a family's name or a serial number.
void refuseUnfitFamily(std::string_view name, int line);
void refuseUnfitSerial(std::string_view serial, int line);

/// Refuses described boards that belong to no family of the store.
void refuseHomelessBoards(StoreDraft const& store, Chassis const& chassis, Findings& findings);

} // namespace kvlsim
