// SPDX-License-Identifier: BSD-2-Clause
// kvloam: shows what the agent knows about the telephony boards of its host.
#include <iostream>

#include "cli/CommandLine.h"

// NOLINTNEXTLINE(bugprone-exception-escape): only a contradictory set-up of the options throws
int main(int argc, char** argv) {
    return kvloam::run(argc, argv, kvloam::Screen::ofStandardOutput, std::cout, std::cerr);
}
