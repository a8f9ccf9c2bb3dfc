// SPDX-License-Identifier: BSD-2-Clause
// The notifications of IF-MIB and DS1-MIB.
#pragma once

#include <cstdint>

#include "agent/notifications/Notification.h"
#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

/// Makes a dsx1LineStatusChange. `lastChange`: hundredths of a second since the agent's start.
Notification lineStatusChange(std::uint32_t ifIndex, int status, std::uint32_t lastChange,
                              Clock::time_point when);

/// Makes an isdnMibCallInformation about the call of `row`.
Notification callInformation(BearerRow const& row, Counters const& counters,
                             Clock::time_point when);

/// Makes a linkDown if `row` is down or lowerLayerDown, else a linkUp. Its ifOperStatus is the
/// present state in both, as a GET answers it.
Notification linkChange(InterfaceRow const& row, Clock::time_point when);

} // namespace kvloamd
