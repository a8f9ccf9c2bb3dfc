// SPDX-License-Identifier: BSD-2-Clause
// The module's one setting.
#pragma once

/// The environment variable that holds the ping interval: whole seconds, 0 for no pings.
inline constexpr char const* kPingIntervalVariable = "Z7SIM_PING_INTERVAL";

/// The interval that `text` says, or the default where it is null. A text that is no interval is
/// reported on standard error and gives the default.
int readPingInterval(char const* text);
