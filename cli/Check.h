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
    std::string critical = "major";        ///< and that is critical
    double oldest = 60;                    ///< seconds; an older snapshot is critical
};

struct CheckResult {
    PluginState state = PluginState::Unknown;
    /// One line of state, a bar and performance data; then one line for each alarm, at most 20.
    std::string text;
};

/// Throws CliError when the answers are none.
CheckResult check(Overview const& overview, CheckLimits const& limits);
/// The result when there is no answer.
CheckResult unknownResult(std::string const& why);

} // namespace kvloam
