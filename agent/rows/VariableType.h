// SPDX-License-Identifier: BSD-2-Clause
// The types of the variables that ALARM-MIB and NOTIFICATION-LOG-MIB list.
#pragma once

namespace kvloamd {

/// The numbers are those of alarmActiveVariableValueType and nlmLogVariableValueType.
enum class VariableType : int {
    Counter32 = 1,
    Unsigned32 = 2,
    TimeTicks = 3,
    Integer32 = 4,
    IpAddress = 5,
    OctetString = 6,
    ObjectId = 7,
    Counter64 = 8,
    Opaque = 9
};

} // namespace kvloamd
