// SPDX-License-Identifier: BSD-2-Clause
// The state of everything as a line and an exit status, for monitoring systems that run plugins.
#pragma once

#include <string>

#include "cli/Summary.h"

namespace kvloam {

/// Exit statuses of monitoring plugins.
enum class PluginState : int { Ok = 0, Warning = 1, Critical = 2, Unknown = 3 };

struct CheckLimits {
    std::string warning = "indeterminate"; ///< the least severity of an alarm that warns
    std::string critical = "major";        ///< the least severity of an alarm that is critical
    double oldest = 60;                    ///< seconds; an older snapshot is critical
};

struct CheckResult {
    PluginState state = PluginState::Unknown;
    /// The state in one line, then "|" and performance data; then a line for each of up to 20
    /// alarms.
    std::string text;
};

/// Throws CliError when an answer lacks what it must have.
CheckResult check(Overview const& overview, CheckLimits const& limits);
/// The result when the agent does not answer: unknown, because of `why`.
CheckResult unknownResult(std::string const& why);

} // namespace kvloam
