// SPDX-License-Identifier: BSD-2-Clause
// What a run of benchmarks has found: times, limits, and changes since a former run.
#pragma once

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include "Baseline.h"
#include "Verdict.h"

/// The exit statuses of the benchmark programs. The first of these that applies counts.
enum BenchStatus : int {
    kUnusable = 2,  ///< wrong usage, or a baseline that cannot be used
    kOver = 1,      ///< something is over its limit, or could not be measured
    kSlower = 3,    ///< something is slower than the baseline
    kUndecided = 4, ///< the machine is too noisy to decide something
    kAllWithin = 0,
};

/// Names of benchmarks that measure the machine begin with this.
inline constexpr std::string_view kFloorPrefix = "floor/";

/// A `Judgement` collects what a run has measured, compares it with limits and with the times of a
/// former run, and derives the program's exit status. Unsynchronised.
class Judgement {
  public:
    /// A time may be this many times the baseline's before it counts as slower: where the linker
    /// puts a function makes as much of a difference.
    static constexpr double kTolerance = 1.1;

    /// `before`: what to compare times with, if anything.
    explicit Judgement(std::optional<Baseline> before = {}) : m_before(std::move(before)) {}

    /// Enters the time of a benchmark, in nanoseconds.
    void addTime(std::string const& benchmark, Spread const& nanoseconds);
    /// Enters what `what` costs in units of `unit`, and its limit, if it has one.
    void addRatio(std::string const& what, std::string const& unit, Spread const& ratio,
                  std::optional<double> limit);
    /// Enters a benchmark that has not measured anything.
    void addFailure(std::string const& benchmark, std::string const& why);

    std::map<std::string, Spread> const& times() const { return m_times; }
    bool hasFailures() const { return !m_failures.empty(); }
    /// Returns the tables of times, ratios and changes, and a last line that sums them up.
    std::string text() const;
    BenchStatus exitStatus() const;

  private:
    struct Ratio {
        std::string what;
        std::string unit;
        Spread ratio;
        std::optional<double> limit;
    };
    struct Change {
        std::string benchmark;
        Spread ratio;
        Verdict verdict;
    };
    struct Changes {
        std::vector<Change> all; ///< of the benchmarks that the baseline has
        bool machineIsSlower = false;
    };

    /// The changes since the baseline. While a floor of the machine takes longer than then, it
    /// cannot be decided whether anything is slower.
    Changes changes() const;
    std::string timesText() const;
    std::string ratiosText() const;
    std::string changesText() const;
    /// How many limits (`Within`, `Over`, `Undecided`) were decided so.
    int count(Verdict verdict) const;

    std::optional<Baseline> m_before;
    std::map<std::string, Spread> m_times;
    std::vector<Ratio> m_ratios;
    std::map<std::string, std::string> m_failures;
};
