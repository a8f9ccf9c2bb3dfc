// SPDX-License-Identifier: BSD-2-Clause
// What a former run has measured, in a file.
#pragma once

#include <iosfwd>
#include <map>
#include <string>

#include "Verdict.h"

/// A `Baseline` is what a run of a benchmark program has measured. Its times compare only with
/// times of the same program on the same machine.
struct Baseline {
    std::string program;
    std::string machine; ///< as `machineName` returns it
    std::string date;
    std::map<std::string, Spread> times; ///< nanoseconds of one run, by benchmark
};

/// Returns the name of the processor and the number of processors, as in "Brand 7, 2 processors".
/// `cpuinfo` is the text of /proc/cpuinfo. The processor has no name on some architectures.
std::string machineName(std::istream& cpuinfo);
/// Returns the name of this machine.
std::string machineName();

/// Replaces the file. An interrupted call leaves the former one. Throws std::runtime_error when it
/// cannot be written, and when a time has no range.
void saveBaseline(Baseline const& baseline, std::string const& file);
/// Returns what the file contains. Throws std::runtime_error with the file's name if it cannot be
/// read, is damaged, or is from another program or machine than these.
Baseline loadBaseline(std::string const& file, std::string const& program,
                      std::string const& machine);
