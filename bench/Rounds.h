// SPDX-License-Identifier: BSD-2-Clause
// Runs benchmarks in turns, so that what else the machine does slows all of them alike.
#pragma once

#include <map>
#include <string>
#include <vector>

/// Counters that a benchmark may set: the nanoseconds that count as the time of a run, and the
/// number of things that a run does.
inline constexpr char const* kTimeOfARun = "nanoseconds";
inline constexpr char const* kItems = "items";

/// What one benchmark took in one round.
struct Taken {
    double nanoseconds = 0; ///< of one run; processor time where one thread does all the work
    double items = 1;
    std::string failure; ///< why it has measured nothing; empty: it has
};

/// By the benchmarks' names.
using Round = std::map<std::string, Taken>;

/// The names of the registered benchmarks that the option `--benchmark_filter` leaves, in their
/// order.
std::vector<std::string> benchmarkNames();

/// Runs the named benchmarks one after the other, `rounds` times.
std::vector<Round> runInRounds(std::vector<std::string> const& names, int rounds);
