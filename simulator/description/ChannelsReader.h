// SPDX-License-Identifier: BSD-2-Clause
// Reads the ISDN channels of a device from their description.
#pragma once

#include <string>

#include "simulator/chassis/Channels.h"
#include "simulator/description/Description.h"

namespace kvlsim {

/// Both throw ChassisError. `of` is the device, for messages: "device 301".
Channels readChannels(Description const& channels, std::string const& of);
ISDNSignallingState signallingStateNamed(Description const& name);

} // namespace kvlsim
