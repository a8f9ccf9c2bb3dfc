// SPDX-License-Identifier: BSD-2-Clause
// The start of the simulated platform, at the first platform call of the process.
#pragma once

#include "simulator/platform/Platform.h"

namespace kvlsim {

/// The platform, started: the first call loads the configured chassis and opens the control socket
/// that KVLSIM_SOCKET names. Never throws. Thread-safe.
Platform& startedPlatform();

} // namespace kvlsim
