// SPDX-License-Identifier: BSD-2-Clause
// What repeated measurements say about a limit.
#pragma once

#include <vector>

/// A `Spread` is the median of repeated measurements, and the range in which their true median lies
/// with a probability of at least 95 %, whatever their distribution.
struct Spread {
    double median = 0;
    double low = 0;
    double high = 0;
};

/// Returns the spread of `values`. Two to five values give no range of that probability; the range
/// then contains all of them. A single value says nothing about the range, which is then infinite.
/// Throws std::invalid_argument when there are no values.
Spread spreadOf(std::vector<double> values);

/// Returns how many times `before` the measurement `now` is. The two were measured apart, so the
/// range goes from the lowest to the highest ratio of their ranges.
Spread ratioOf(Spread const& now, Spread const& before);

enum class Verdict {
    Within,
    Over,
    Undecided, ///< the limit lies within the range
};

/// Decides whether a measurement is within `limit`, of which the range must be wholly on one side.
Verdict decide(Spread const& measured, double limit);
