// SPDX-License-Identifier: BSD-2-Clause
#include "GrowthReport.h"

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>
#include <iterator>
#include <memory>
#include <vector>

#include "RefreshProcess.h"

namespace {

constexpr std::array kBoards{125, 250, 500, 1000};
constexpr int kRounds = 501;
constexpr double kLargestGrowth = 2.2;

double median(std::vector<double> values) {
    auto const middle = values.begin() + std::ssize(values) / 2;
    std::ranges::nth_element(values, middle);
    return *middle;
}

} // namespace

bool reportGrowth() {
    std::vector<std::unique_ptr<RefreshProcess>> processes;
    for (int const boards : kBoards)
        processes.push_back(std::make_unique<RefreshProcess>(boards));
    std::array<std::vector<double>, kBoards.size()> times;
    std::array<std::vector<double>, kBoards.size()> growths;
    for (int round = 0; round < kRounds; ++round)
        for (std::size_t i = 0; i < kBoards.size(); ++i) {
            times[i].push_back(processes[i]->refresh());
            if (i > 0) growths[i].push_back(times[i].back() / times[i - 1].back());
        }
    std::printf("\n%-40s %9s %9s %9s\n", "one refresh", "ms", "growth", "limit");
    bool kept = true;
    for (std::size_t i = 0; i < kBoards.size(); ++i) {
        std::printf("%4d boards%30s %9.2f", kBoards[i], "", median(times[i]) * 1e3);
        if (i > 0) {
            double const growth = median(growths[i]);
            bool const within = growth <= kLargestGrowth;
            kept = kept && within;
            std::printf(" %9.2f %9.2f%s", growth, kLargestGrowth, within ? "" : "  EXCEEDED");
        }
        std::printf("\n");
    }
    return kept;
}
