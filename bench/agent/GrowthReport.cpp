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

constexpr std::array kBoards{125, 250, 500, 1000, 2000, 4000};
constexpr int kRounds = 101;
constexpr double kLargestGrowth = 2.1;

struct Measured {
    Happened happened;
    char const* name;
    double mostOfEverything; ///< the limit relative to reading everything; 0: it is everything
};

constexpr std::array kMeasured{
    Measured{Happened::Everything, "everything", 0},
    Measured{Happened::Counting, "what lines have counted", 0.35},
    Measured{Happened::StatusOf1, "one board that stops or starts", 0.3},
};

using Samples = std::vector<double>;

std::string nameOf(Measured const& measured, int boards) {
    return std::string("refresh of ") + measured.name + ", " + std::to_string(boards) + " boards";
}

Samples ratios(Samples const& ours, Samples const& theirs) {
    Samples ratios;
    for (std::size_t i = 0; i < ours.size(); ++i)
        ratios.push_back(ours[i] / theirs[i]);
    return ratios;
}

} // namespace

void reportGrowth(Judgement& judgement) {
    std::fprintf(stderr, "measuring: growth of a refresh\n");
    std::vector<std::unique_ptr<RefreshProcess>> processes;
    for (int const boards : kBoards)
        processes.push_back(std::make_unique<RefreshProcess>(boards));
    std::array<std::array<Samples, kBoards.size()>, kMeasured.size()> times;
    for (int round = 0; round < kRounds; ++round)
        for (std::size_t kind = 0; kind < kMeasured.size(); ++kind)
            for (std::size_t i = 0; i < kBoards.size(); ++i)
                times[kind][i].push_back(processes[i]->refresh(kMeasured[kind].happened) * 1e9);
    for (std::size_t kind = 0; kind < kMeasured.size(); ++kind) {
        Measured const& measured = kMeasured[kind];
        for (std::size_t i = 0; i < kBoards.size(); ++i) {
            std::string const name = nameOf(measured, kBoards[i]);
            judgement.addTime(name, spreadOf(times[kind][i]));
            if (i > 0)
                judgement.addRatio(name, "of " + std::to_string(kBoards[i - 1]) + " boards",
                                   spreadOf(ratios(times[kind][i], times[kind][i - 1])),
                                   kLargestGrowth);
            if (measured.mostOfEverything > 0)
                judgement.addRatio(name, "of a refresh of everything",
                                   spreadOf(ratios(times[kind][i], times[0][i])),
                                   measured.mostOfEverything);
        }
    }
}
