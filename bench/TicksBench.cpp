// SPDX-License-Identifier: BSD-2-Clause
// What the seconds of 16,000 lines of the simulated platform cost.
//
// Prints the processor time of a second, for lines without errors and with errors in every second,
// and ends with status 1 if lines without errors take more than 0.5 % of a processor.
#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <ctime>
#include <string>
#include <vector>

#include "DrivenLineScheduler.h"
#include "Z7SimBoardFactory.h"
#include "board/BoardManager.h"
#include "simulator/exports/Control.h"

namespace {

constexpr std::size_t kBoards = 4000;
constexpr std::size_t kLinesOfABoard = 4;
constexpr int kSeconds = 61;
constexpr double kLimit = 0.5; ///< percent of a processor

std::chrono::nanoseconds platformTime{};

class Factory final : public Z7SimBoardFactory {
  public:
    using Z7SimBoardFactory::check_for_changed_boards;
};

std::string chassis(std::string const& line) {
    std::string text = "boards:\n";
    for (std::size_t board = 1; board <= kBoards; ++board) {
        text += "- {handle: " + std::to_string(10 * board) + ", attributes: {SERIAL_NUMBER: S" +
                std::to_string(board) + ", BOARD_CONDITION: 3, BOARD_PRESENT: 1}, devices: [";
        for (std::size_t i = 1; i <= kLinesOfABoard; ++i)
            text +=
                "{handle: " + std::to_string(10 * board + i) + ", type: 501, line: " + line + "}, ";
        text += "]}\n";
    }
    return text;
}

double processorTime() {
    timespec time{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) + 1e-9 * static_cast<double>(time.tv_nsec);
}

/// Uses the processor's caches for something else, as the rest of a second does.
void useCaches() {
    static std::vector<char> memory(std::size_t{128} << 20U);
    for (std::size_t i = 0; i < memory.size(); i += 64)
        ++memory[i];
}

/// The processor time of one second, in seconds: the median, after one to warm up.
double oneSecond() {
    std::vector<double> times;
    for (int i = 0; i < kSeconds; ++i) {
        useCaches();
        platformTime += std::chrono::seconds(1);
        double const before = processorTime();
        DrivenLineScheduler::install().passOfNextSecond();
        times.push_back(processorTime() - before);
    }
    std::ranges::sort(times);
    return times[times.size() / 2];
}

/// In percent of a processor.
double measure(char const* what, std::string const& line) {
    kvlsim::loadChassis(chassis(line));
    auto* const factory = new Factory;
    factory->SetPingInterval(0);
    ReferenceCounter<BoardManager> const manager(new BoardManager);
    manager->Attach(ReferenceCounter<BoardFactory>(factory));
    double const time = oneSecond();
    std::size_t const lines = kBoards * kLinesOfABoard;
    std::printf(
        "one second of %zu lines %s: %.2f ms of processor time, %.0f ns a line, %.2f %% of a "
        "processor\n",
        lines, what, 1e3 * time, 1e9 * time / static_cast<double>(lines), 100 * time);
    kvlsim::loadChassis("boards: []");
    factory->check_for_changed_boards();
    return 100 * time;
}

} // namespace

int main() {
    DrivenLineScheduler::install();
    kvlsim::setLineClock([] { return platformTime; });
    double const clean = measure("without errors", "{type: esf}");
    measure("with errors", "{type: esf, errors: {path-violations: 3, code-violations: 2}}");
    return clean > kLimit ? 1 : 0;
}
