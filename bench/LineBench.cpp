// SPDX-License-Identifier: BSD-2-Clause
// One second of DS1 lines as the reference module counts them.
#include <cstddef>
#include <memory>
#include <string>
#include <vector>

#include <benchmark/benchmark.h>

#include "DrivenScheduler.h"
#include "LineScheduler.h"
#include "LineSource.h"
#include "LineState.h"
#include "Z7SimIntervalTable.h"
#include "core/ReferenceCounter.h"
#include "simulator/exports/Control.h"

namespace {

/// A line's counters in memory: a few errors every second.
class CountingLine final : public LineSource {
  public:
    bool read(DS1LineCounters& counters) override {
        ++m_counters.seconds;
        m_counters.pathCodeViolations += 3;
        m_counters.lineCodeViolations += 2;
        counters = m_counters;
        return true;
    }

  private:
    DS1LineCounters m_counters{};
};

using Table = ReferenceCounter<DS1IntervalTable>;

/// The benchmark ticks the table, not the scheduler of lines.
Table tableOf(std::shared_ptr<LineSource> source) {
    Table table(new Z7SimIntervalTable(LineFormat::esf, {}, std::move(source),
                                       std::make_shared<LineState>(), {}));
    LineScheduler::instance().Remove(table.get());
    return table;
}

constexpr std::size_t kLines = 10000;

/// The lines of all passes, made once and one after the other, as those of a host are.
std::vector<Table>& lines() {
    static std::vector<Table> tables;
    if (tables.empty())
        for (std::size_t i = 0; i < kLines; ++i)
            tables.push_back(tableOf(std::make_shared<CountingLine>()));
    return tables;
}

/// Other benchmarks do without ten thousand objects beside theirs.
void dropLines(benchmark::State const&) {
    lines().clear();
}

template <std::size_t count>
void oneSecondOfLinesOurs(benchmark::State& state) {
    DrivenScheduler scheduler;
    for (std::size_t i = 0; i < count; ++i)
        scheduler.enter(lines()[i].get());
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

void oneSecondOfLinesPeer(benchmark::State& state) {
    std::vector<DS1IntervalTable*> list;
    for (auto const& table : lines())
        list.push_back(table.get());
    for (auto _ : state)
        for (DS1IntervalTable* const table : list)
            table->ScheduledAction();
}

void oneLineInMemory(benchmark::State& state) {
    Table const table = tableOf(std::make_shared<CountingLine>());
    for (auto _ : state)
        table->ScheduledAction();
}

void oneLineOfThePlatform(benchmark::State& state) {
    kvlsim::loadChassis("boards: [{handle: 1, attributes: {SERIAL_NUMBER: A}, devices: [{handle: "
                        "11, type: 501, line: {type: esf}}]}]");
    Table const table = tableOf(std::make_shared<PlatformLine>(11));
    for (auto _ : state)
        table->ScheduledAction();
}

BENCHMARK(oneSecondOfLinesOurs<kLines>)->Name("one second of 10,000 lines/ours");
BENCHMARK(oneSecondOfLinesPeer)->Name("one second of 10,000 lines/peer");
// The same pass at two sizes: how it grows.
BENCHMARK(oneSecondOfLinesOurs<kLines>)->Name("one second, from 1,000 to 10,000 lines/ours");
BENCHMARK(oneSecondOfLinesOurs<1000>)->Name("one second, from 1,000 to 10,000 lines/peer");
BENCHMARK(oneLineInMemory)->Name("one second of a line, counters in memory")->Setup(dropLines);
BENCHMARK(oneLineOfThePlatform)->Name("one second of a line, counters of the simulated platform");

} // namespace
