// SPDX-License-Identifier: BSD-2-Clause
// What the project promises of its speed.
#pragma once

#include <string>
#include <vector>

/// So many runs of a benchmark.
struct Runs {
    double count;
    std::string benchmark;
};

/// The names of benchmarks that measure the machine (FloorBench.cpp, agent/RoundTripBench.cpp).
inline constexpr char const* kLockPair = "floor/lock pair";
inline constexpr char const* kLookUp = "floor/look-up";
inline constexpr char const* kCacheMiss = "floor/cache miss";
inline constexpr char const* kAllocation = "floor/allocation";
inline constexpr char const* kRoundTrip = "floor/loopback round trip/real_time";
inline constexpr char const* kLocalRoundTrip = "floor/local round trip/real_time";

/// A `Limit` is the largest permitted ratio of a topic's cost to another cost of the same machine.
///
/// The topic is a benchmark's name without "/ours". Without a floor, an item of "<topic>/ours" is
/// compared with an item of "<topic>/peer"; with one, a run of the benchmark with the sum of the
/// floor's runs.
struct Limit {
    std::string topic;
    double factor;
    std::string unit = "its peer"; ///< what the cost is compared with, for the reader
    std::vector<Runs> floor = {};
};
