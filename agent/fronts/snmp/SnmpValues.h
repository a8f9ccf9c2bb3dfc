// SPDX-License-Identifier: BSD-2-Clause
// Values as the SNMP library's variables hold them.
#pragma once

#include "agent/objects/Value.h"

struct variable_list;

namespace kvloamd {

/// The library's number of a type.
unsigned char asnTypeOf(ValueType type);

/// Gives `variable` a value, which is known.
void setVariable(variable_list* variable, ValueType type, Value const& value);

} // namespace kvloamd
