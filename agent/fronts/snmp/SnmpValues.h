// SPDX-License-Identifier: BSD-2-Clause
// Converts values to the SNMP library's types.
#pragma once

#include "agent/objects/Value.h"

struct variable_list;

namespace kvloamd {

/// The library's number for a type.
unsigned char asnTypeOf(ValueType type);

/// Sets the value of `variable`. `value` must be known.
void setVariable(variable_list* variable, ValueType type, Value const& value);

} // namespace kvloamd
