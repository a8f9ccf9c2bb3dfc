// SPDX-License-Identifier: BSD-2-Clause
// One second of many interval tables: the scheduler's pass against a plain loop.
#include <array>
#include <cstddef>
#include <memory>
#include <vector>

#include <benchmark/benchmark.h>

#include "DrivenScheduler.h"
#include "board/DS1IntervalTable.h"

namespace {

/// What a table does in a second: counts into a record of its own.
class Ticking final : public Schedulable {
  public:
    int ScheduledAction() override {
        for (DS1Counter& counter : m_counters)
            counter += 1;
        return 0;
    }

  private:
    std::array<DS1Counter, 15> m_counters;
};

std::vector<std::unique_ptr<Ticking>> makeTables(std::size_t count) {
    std::vector<std::unique_ptr<Ticking>> tables(count);
    for (auto& table : tables)
        table = std::make_unique<Ticking>();
    return tables;
}

template <std::size_t count>
void oneSecondOurs(benchmark::State& state) {
    auto const tables = makeTables(count);
    DrivenScheduler scheduler;
    for (auto const& table : tables)
        scheduler.enter(table.get());
    scheduler.passOfNextSecond();
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

template <std::size_t count>
void oneSecondPeer(benchmark::State& state) {
    auto const tables = makeTables(count);
    std::vector<Schedulable*> list;
    for (auto const& table : tables)
        list.push_back(table.get());
    for (auto _ : state)
        for (Schedulable* const table : list)
            table->ScheduledAction();
}

BENCHMARK(oneSecondOurs<1000>)->Name("one second of 1,000 tables/ours");
BENCHMARK(oneSecondPeer<1000>)->Name("one second of 1,000 tables/peer");
BENCHMARK(oneSecondOurs<10000>)->Name("one second of 10,000 tables/ours");
BENCHMARK(oneSecondPeer<10000>)->Name("one second of 10,000 tables/peer");
// The same pass at two sizes: how it grows.
BENCHMARK(oneSecondOurs<10000>)->Name("one second, from 1,000 to 10,000 tables/ours");
BENCHMARK(oneSecondOurs<1000>)->Name("one second, from 1,000 to 10,000 tables/peer");

} // namespace
