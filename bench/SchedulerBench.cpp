// SPDX-License-Identifier: BSD-2-Clause
// One second of many interval tables: the scheduler's pass against a plain loop.
#include <array>
#include <cstddef>
#include <vector>

#include <benchmark/benchmark.h>

#include "DrivenScheduler.h"
#include "board/DS1IntervalTable.h"

namespace {

/// What a table does in a second: counts into a record of its own.
class Ticking final : public Schedulable {
  public:
    int ScheduledAction() override {
        m_timeElapsed += 1;
        for (DS1Counter DS1Interval::*const counter : kCounters)
            m_current.*counter += 1;
        return 0;
    }

  private:
    static constexpr std::array kCounters{
        &DS1Interval::ErrorSeconds,
        &DS1Interval::SeverelyErrorSeconds,
        &DS1Interval::SeverelyErrorFramingSeconds,
        &DS1Interval::UnavailableSeconds,
        &DS1Interval::ControlledSlipSeconds,
        &DS1Interval::PathCodingViolations,
        &DS1Interval::LineErrorSeconds,
        &DS1Interval::BurstyErrorSeconds,
        &DS1Interval::DegradedMinutes,
        &DS1Interval::LineCodeViolations,
    };

    DS1Counter m_timeElapsed;
    DS1Interval m_current;
};

template <std::size_t count>
void oneSecondOurs(benchmark::State& state) {
    std::vector<Ticking> tables(count);
    DrivenScheduler scheduler;
    for (Ticking& table : tables)
        scheduler.enter(&table);
    for (auto _ : state)
        scheduler.passOfNextSecond();
}

template <std::size_t count>
void oneSecondPeer(benchmark::State& state) {
    std::vector<Ticking> tables(count);
    std::vector<Schedulable*> list;
    for (Ticking& table : tables)
        list.push_back(&table);
    for (auto _ : state)
        for (Schedulable* const table : list)
            table->ScheduledAction();
}

/// All tables enter the list one after the other and leave it in the same order.
template <std::size_t count>
void enterAndRemove(benchmark::State& state) {
    std::vector<Ticking> tables(count);
    for (auto _ : state) {
        DrivenScheduler scheduler;
        for (Ticking& table : tables)
            scheduler.AddPeriodic(&table, 1);
        for (Ticking& table : tables)
            scheduler.Remove(&table);
    }
}

BENCHMARK(oneSecondOurs<1000>)->Name("one second of 1,000 tables/ours");
BENCHMARK(oneSecondPeer<1000>)->Name("one second of 1,000 tables/peer");
BENCHMARK(oneSecondOurs<10000>)->Name("one second of 10,000 tables/ours");
BENCHMARK(oneSecondPeer<10000>)->Name("one second of 10,000 tables/peer");
// The same pass at two sizes: how it grows.
BENCHMARK(oneSecondOurs<10000>)->Name("one second, from 1,000 to 10,000 tables/ours");
BENCHMARK(oneSecondOurs<1000>)->Name("one second, from 1,000 to 10,000 tables/peer");
// Entering and removing them: how it grows.
BENCHMARK(enterAndRemove<100000>)
    ->Name("entry and removal, from 10,000 to 100,000 tables/ours")
    ->Unit(benchmark::kMillisecond);
BENCHMARK(enterAndRemove<10000>)
    ->Name("entry and removal, from 10,000 to 100,000 tables/peer")
    ->Unit(benchmark::kMillisecond);

} // namespace
