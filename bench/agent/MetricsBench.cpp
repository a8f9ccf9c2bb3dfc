// SPDX-License-Identifier: BSD-2-Clause
// How long the agent writes the metrics of a scrape.
#include <benchmark/benchmark.h>

#include "agent/fronts/metrics/Metrics.h"
#include "tests/agent/fronts/metrics/SampleBoards.h"

namespace {

using namespace kvloamd;

/// Boards with four lines each; `state.range(1)`: bearer channels of a line, with series each.
void writeMetrics(benchmark::State& state) {
    SampleSize size;
    size.boards = static_cast<std::uint32_t>(state.range(0));
    size.linesOfABoard = 4;
    size.channelsOfALine = static_cast<std::uint32_t>(state.range(1));
    auto const snapshot = sampleBoards(size);
    Counters const counters;
    MetricOptions options;
    options.format = MetricFormat::OpenMetrics;
    options.channels = size.channelsOfALine > 0;
    std::size_t octets = 0;
    for (auto _ : state) {
        // Not the cache, which writes only once for a snapshot.
        MetricMoment moment;
        moment.process = readProcessUsage();
        octets = metricsText({*snapshot, counters}, moment, options, octets).size();
    }
    state.counters["octets"] = static_cast<double>(octets);
}

BENCHMARK(writeMetrics)
    ->Args({4, 0})
    ->Args({1000, 0})
    ->Args({100, 23})
    ->Unit(benchmark::kMillisecond);

} // namespace

BENCHMARK_MAIN();
