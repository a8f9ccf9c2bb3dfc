// SPDX-License-Identifier: BSD-2-Clause
// Prints, after the ordinary report, how many times its peer each of our operations costs.
#pragma once

#include <map>
#include <string>

#include <benchmark/benchmark.h>

/// Benchmarks are named "<topic>/ours" and "<topic>/peer", with the same arguments behind. The
/// limit of a topic is what the project promises of the ratio.
class RatioReporter : public benchmark::ConsoleReporter {
  public:
    explicit RatioReporter(std::map<std::string, double> limits) : m_limits(std::move(limits)) {}

    void ReportRuns(std::vector<Run> const& runs) override;
    /// The table of ratios. Returns whether every ratio that has a limit keeps it.
    bool printRatios() const;

  private:
    std::map<std::string, double> m_limits;
    std::map<std::string, double> m_times; ///< median ns per item by name, for each side
};
