// SPDX-License-Identifier: BSD-2-Clause
// Reads the devices, sub-devices and processors of a board from the device mapper.
#pragma once

#include <cstdint>

#include "agent/rows/DeviceRows.h"

namespace kvloamd {

/// How many channel groups of a device are asked for their protocol.
inline constexpr int kChannelGroups = 8;

/// Reads all that the device mapper has below the board of handle `board`. Objects whose handles do
/// not fit an index are left out.
DeviceRows readDevices(long board, std::uint32_t boardIndex);

} // namespace kvloamd
