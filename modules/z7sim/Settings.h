// SPDX-License-Identifier: BSD-2-Clause
// The module's settings, which are environment variables.
#pragma once

#include "LineFailures.h"

/// The ping interval in whole seconds; 0: no pings.
inline constexpr char const* kPingIntervalVariable = "Z7SIM_PING_INTERVAL";
/// The two `FailureTimes`.
inline constexpr char const* kFailureDeclarationVariable = "Z7SIM_FAILURE_DECLARATION";
inline constexpr char const* kFailureClearingVariable = "Z7SIM_FAILURE_CLEARING";

/// These take the text of a variable, null where it is not set, and return its value, or the
/// default. A text that is no such value is reported on standard error.
int readPingInterval(char const* text);
FailureTimes readFailureTimes(char const* declaration, char const* clearing);
