// SPDX-License-Identifier: BSD-2-Clause
// One second of DS1 lines as the reference module counts them.
#include <chrono>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "DrivenLineScheduler.h"
#include "LineRecords.h"
#include "LineSource.h"
#include "LineState.h"
#include "LineTicks.h"
#include "Z7SimIntervalTable.h"
#include "core/ReferenceCounter.h"
#include "simulator/exports/Control.h"

namespace {

constexpr std::size_t kLinesOfABoard = 4;

/// What a line counts in a second.
void second(DS1LineCounters& counters, std::uint32_t errors) {
    ++counters.seconds;
    counters.pathCodeViolations += errors;
    counters.lineCodeViolations += errors;
}

/// A line's counters in memory.
class CountingLine final : public LineSource {
  public:
    explicit CountingLine(std::uint32_t errors) : m_errors(errors) {}

    bool read(DS1LineCounters& counters) override {
        second(m_counters, m_errors);
        counters = m_counters;
        return true;
    }

  private:
    std::uint32_t m_errors;
    DS1LineCounters m_counters{};
};

/// The same of all lines of a board. Their devices are 0, 1, 2 ...
class CountingBoard final : public LineBatch {
  public:
    explicit CountingBoard(std::uint32_t errors) : m_errors(errors) {}

    std::size_t read(std::span<DS1BoardLine> lines) override {
        for (std::size_t i = 0; i < lines.size(); ++i) {
            second(m_counters[i], m_errors);
            lines[i] = {static_cast<std::int32_t>(i), m_counters[i]};
        }
        return lines.size();
    }

  private:
    std::uint32_t m_errors;
    DS1LineCounters m_counters[kLinesOfABoard]{};
};

using Table = ReferenceCounter<Z7SimIntervalTable>;

Table tableOf(std::shared_ptr<LineSource> source, Z7SimIntervalTable::Ticked ticked) {
    DrivenLineScheduler::install();
    return Table(new Z7SimIntervalTable(LineFormat::esf, {}, std::move(source),
                                        std::make_shared<LineState>(), {}, ticked));
}

/// A board of lines whose counters are in memory.
struct MemoryBoard {
    explicit MemoryBoard(std::uint32_t errors) {
        DrivenLineScheduler::install();
        ticks = std::make_unique<LineTicks>(std::make_unique<CountingBoard>(errors));
        for (std::size_t i = 0; i < kLinesOfABoard; ++i) {
            tables.push_back(tableOf(std::make_shared<CountingLine>(errors),
                                     Z7SimIntervalTable::Ticked::withBoard));
            ticks->add(static_cast<long>(i), *tables.back().get());
        }
    }

    std::vector<Table> tables;
    std::unique_ptr<LineTicks> ticks; ///< after the tables, which it uses
};

constexpr std::size_t kLines = 10000;
constexpr std::uint32_t kErrors = 3;

/// The boards of all passes, made once and one after the other, as those of a host are.
std::vector<std::unique_ptr<MemoryBoard>>& boards() {
    static std::vector<std::unique_ptr<MemoryBoard>> all;
    if (all.empty())
        for (std::size_t i = 0; i < kLines / kLinesOfABoard; ++i)
            all.push_back(std::make_unique<MemoryBoard>(kErrors));
    return all;
}

/// Other benchmarks do without ten thousand objects beside theirs.
void dropLines(benchmark::State const&) {
    boards().clear();
}

template <std::size_t count>
void oneSecondOfLinesOurs(benchmark::State& state) {
    DrivenLineScheduler scheduler;
    for (std::size_t i = 0; i < count / kLinesOfABoard; ++i)
        scheduler.AddPeriodic(boards()[i]->ticks.get(), 1);
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

template <std::uint32_t errors>
void oneSecondOfAThousandLines(benchmark::State& state) {
    std::vector<std::unique_ptr<MemoryBoard>> all;
    DrivenLineScheduler scheduler;
    for (std::size_t i = 0; i < 1000 / kLinesOfABoard; ++i) {
        all.push_back(std::make_unique<MemoryBoard>(errors));
        scheduler.AddPeriodic(all.back()->ticks.get(), 1);
    }
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

void oneSecondOfLinesPeer(benchmark::State& state) {
    DrivenLineScheduler scheduler; // gives the time
    std::vector<LineTicks*> list;
    for (auto const& board : boards())
        list.push_back(board->ticks.get());
    for (auto _ : state) {
        scheduler.passOfNextSecond();
        for (LineTicks* const ticks : list)
            ticks->ScheduledAction();
    }
}

template <std::uint32_t errors>
void oneLineInMemory(benchmark::State& state) {
    Table const table =
        tableOf(std::make_shared<CountingLine>(errors), Z7SimIntervalTable::Ticked::withBoard);
    DrivenLineScheduler scheduler;
    scheduler.AddPeriodic(table.get(), 1);
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

template <std::uint32_t errors>
void oneBoardInMemory(benchmark::State& state) {
    MemoryBoard const board(errors);
    DrivenLineScheduler scheduler;
    scheduler.AddPeriodic(board.ticks.get(), 1);
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

std::chrono::nanoseconds platformTime{};

/// A thousand lines of the simulated platform. `line`: how each of them is described.
void oneSecondOfThePlatform(benchmark::State& state, std::string const& line) {
    kvlsim::setLineClock([] { return platformTime; });
    constexpr std::size_t boards = 1000 / kLinesOfABoard;
    std::string chassis = "boards:\n";
    for (std::size_t board = 1; board <= boards; ++board) {
        chassis += "- {handle: " + std::to_string(10 * board) + ", attributes: {SERIAL_NUMBER: S" +
                   std::to_string(board) + "}, devices: [";
        for (std::size_t i = 1; i <= kLinesOfABoard; ++i)
            chassis +=
                "{handle: " + std::to_string(10 * board + i) + ", type: 501, line: " + line + "}, ";
        chassis += "]}\n";
    }
    kvlsim::loadChassis(chassis);
    DrivenLineScheduler::install();
    std::vector<std::unique_ptr<LineRecords>> records;
    for (std::size_t board = 1; board <= boards; ++board) {
        records.push_back(
            std::make_unique<LineRecords>(static_cast<long>(10 * board), FailureTimes()));
        for (std::size_t i = 1; i <= kLinesOfABoard; ++i)
            records.back()->of(static_cast<long>(10 * board + i), LineFormat::esf);
    }
    for (auto _ : state) {
        platformTime += std::chrono::seconds(1);
        DrivenLineScheduler::install().passOfNextSecond();
    }
    kvlsim::setLineClock(nullptr);
}

/// A board of the simulated platform. `line`: how each of its lines is described.
void oneBoardOfThePlatform(benchmark::State& state, std::string const& line) {
    kvlsim::setLineClock([] { return platformTime; });
    std::string devices;
    for (std::size_t i = 0; i < kLinesOfABoard; ++i)
        devices += "{handle: 1" + std::to_string(i) + ", type: 501, line: " + line + "}, ";
    kvlsim::loadChassis("boards: [{handle: 1, attributes: {SERIAL_NUMBER: A}, devices: [" +
                        devices + "]}]");
    DrivenLineScheduler::install();
    LineRecords records(1, {});
    for (std::size_t i = 0; i < kLinesOfABoard; ++i)
        records.of(static_cast<long>(10 + i), LineFormat::esf);
    for (auto _ : state) {
        platformTime += std::chrono::seconds(1);
        DrivenLineScheduler::install().passOfNextSecond();
    }
    kvlsim::setLineClock(nullptr);
}

BENCHMARK(oneSecondOfLinesOurs<kLines>)->Name("one second of 10,000 lines/ours");
BENCHMARK(oneSecondOfLinesPeer)->Name("one second of 10,000 lines/peer");
// The same pass at two sizes: how it grows.
BENCHMARK(oneSecondOfLinesOurs<kLines>)->Name("one second, from 1,000 to 10,000 lines/ours");
BENCHMARK(oneSecondOfLinesOurs<1000>)->Name("one second, from 1,000 to 10,000 lines/peer");
BENCHMARK(oneSecondOfAThousandLines<kErrors>)->Name("one second of 1,000 lines");
BENCHMARK(oneSecondOfAThousandLines<0>)->Name("one second of 1,000 lines without errors");
BENCHMARK(oneLineInMemory<kErrors>)
    ->Name("one second of a line, counters in memory")
    ->Setup(dropLines);
BENCHMARK(oneLineInMemory<0>)->Name("one second of a line without errors, counters in memory");
BENCHMARK(oneBoardInMemory<kErrors>)->Name("one second of four lines, counters in memory");
BENCHMARK(oneBoardInMemory<0>)->Name("one second of four lines without errors, counters in memory");
BENCHMARK_CAPTURE(oneBoardOfThePlatform, errored, "{type: esf, errors: {path-violations: 3}}")
    ->Name("one second of four lines, counters of the simulated platform");
BENCHMARK_CAPTURE(oneBoardOfThePlatform, clean, "{type: esf}")
    ->Name("one second of four lines without errors, counters of the simulated platform");
BENCHMARK_CAPTURE(oneSecondOfThePlatform, errored, "{type: esf, errors: {path-violations: 3}}")
    ->Name("one second of 1,000 lines of the simulated platform");
BENCHMARK_CAPTURE(oneSecondOfThePlatform, clean, "{type: esf}")
    ->Name("one second of 1,000 lines of the simulated platform without errors");

} // namespace
