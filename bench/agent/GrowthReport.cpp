// SPDX-License-Identifier: BSD-2-Clause
#include "GrowthReport.h"

#include <array>
#include <cstddef>
#include <cstdio>
#include <memory>
#include <string>
#include <vector>

#include "RefreshProcess.h"

namespace {

constexpr std::array kBoards{125, 250, 500, 1000};
constexpr int kRounds = 501;
constexpr double kLargestGrowth = 2.2;

std::string nameOf(int boards) {
    return "one refresh of " + std::to_string(boards) + " boards";
}

} // namespace

void reportGrowth(Judgement& judgement) {
    std::fprintf(stderr, "measuring: growth of a refresh\n");
    std::vector<std::unique_ptr<RefreshProcess>> processes;
    for (int const boards : kBoards)
        processes.push_back(std::make_unique<RefreshProcess>(boards));
    std::array<std::vector<double>, kBoards.size()> times;
    std::array<std::vector<double>, kBoards.size()> growths;
    for (int round = 0; round < kRounds; ++round)
        for (std::size_t i = 0; i < kBoards.size(); ++i) {
            times[i].push_back(processes[i]->refresh() * 1e9);
            if (i > 0) growths[i].push_back(times[i].back() / times[i - 1].back());
        }
    for (std::size_t i = 0; i < kBoards.size(); ++i) {
        judgement.addTime(nameOf(kBoards[i]), spreadOf(times[i]));
        if (i > 0)
            judgement.addRatio(nameOf(kBoards[i]),
                               "of " + std::to_string(kBoards[i - 1]) + " boards",
                               spreadOf(growths[i]), kLargestGrowth);
    }
}
