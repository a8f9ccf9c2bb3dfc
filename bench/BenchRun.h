// SPDX-License-Identifier: BSD-2-Clause
// The main program of the benchmarks that have limits.
#pragma once

#include <functional>
#include <vector>

#include "Judgement.h"
#include "Limit.h"

/// Runs the registered benchmarks, prints times, ratios and changes, and returns the program's exit
/// status. The options are those of the benchmark library and `--rounds`, `--baseline` and
/// `--save-baseline`.
///
/// Benchmarks that have the same name up to the first "/" run in turns, together with the floors of
/// their limits, and are compared round by round. "<topic>/ours" is compared with "<topic>/peer"
/// whether or not the topic has a limit; both may have the same arguments behind.
///
/// `more`: measures what is not a benchmark of the library's kind.
int runBenchmarks(int argc, char** argv, std::vector<Limit> const& limits,
                  std::function<void(Judgement&)> const& more = {});
