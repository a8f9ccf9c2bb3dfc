// SPDX-License-Identifier: BSD-2-Clause
#include "Verdict.h"

#include <algorithm>
#include <cmath>
#include <cstddef>
#include <limits>
#include <numbers>
#include <stdexcept>

namespace {

constexpr double kProbability = 0.95;

/// The probability that exactly `below` of `count` values are below their true median.
double probabilityOf(std::size_t below, std::size_t count) {
    auto const k = static_cast<double>(below);
    auto const n = static_cast<double>(count);
    return std::exp(std::lgamma(n + 1) - std::lgamma(k + 1) - std::lgamma(n - k + 1) -
                    n * std::numbers::ln2);
}

/// How many of `count` sorted values may be left out at each end, so that the true median is still
/// among the others with `kProbability`.
std::size_t leftOutOf(std::size_t count) {
    // It is outside on one side if at most `leftOut` values are on the other side of it.
    std::size_t leftOut = 0;
    double outside = 2 * probabilityOf(0, count);
    while (2 * (leftOut + 1) < count) {
        outside += 2 * probabilityOf(leftOut + 1, count);
        if (outside > 1 - kProbability) break;
        ++leftOut;
    }
    return leftOut;
}

} // namespace

Spread spreadOf(std::vector<double> values) {
    if (values.empty()) throw std::invalid_argument("nothing was measured");
    std::ranges::sort(values);
    std::size_t const count = values.size();
    double const median = (values[(count - 1) / 2] + values[count / 2]) / 2;
    if (count == 1) return {median, 0, std::numeric_limits<double>::infinity()};
    std::size_t const leftOut = leftOutOf(count);
    return {median, values[leftOut], values[count - 1 - leftOut]};
}

Spread ratioOf(Spread const& now, Spread const& before) {
    return {now.median / before.median, now.low / before.high, now.high / before.low};
}

Verdict decide(Spread const& measured, double limit) {
    if (measured.high <= limit) return Verdict::Within;
    return measured.low > limit ? Verdict::Over : Verdict::Undecided;
}
