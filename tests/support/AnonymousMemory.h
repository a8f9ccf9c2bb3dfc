// SPDX-License-Identifier: BSD-2-Clause
// How much memory a process has for itself.
#pragma once

#include <cstdlib>
#include <fstream>
#include <string>

#include <gtest/gtest.h>

/// The memory of a process that is not shared with a file, in bytes.
inline long anonymousMemory(std::string const& process = "self") {
    std::ifstream rollup("/proc/" + process + "/smaps_rollup");
    for (std::string line; std::getline(rollup, line);)
        if (line.starts_with("Anonymous:")) return 1024 * std::atol(line.c_str() + 10);
    ADD_FAILURE() << "the system does not tell the memory of process " << process;
    return 0;
}
