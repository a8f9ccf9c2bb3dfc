// SPDX-License-Identifier: BSD-2-Clause
// kvloam's command line.
#pragma once

#include <functional>
#include <iosfwd>

#include "cli/Screen.h"

namespace kvloam {

/// Runs the program and returns its exit status. `screen` describes what `out` is; it is asked for
/// again for each output of --watch.
int run(int argc, char const* const* argv, std::function<Screen()> const& screen, std::ostream& out,
        std::ostream& errors);

} // namespace kvloam
