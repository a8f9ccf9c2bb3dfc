// SPDX-License-Identifier: BSD-2-Clause
// What the machine itself needs for what our operations cannot do without.
#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <mutex>
#include <numeric>
#include <random>
#include <unordered_map>
#include <vector>

#include <benchmark/benchmark.h>

#include "Limit.h"

namespace {

/// An uncontended recursive lock is taken and released.
void lockPair(benchmark::State& state) {
    std::recursive_mutex mutex;
    for (auto _ : state) {
        mutex.lock();
        benchmark::ClobberMemory();
        mutex.unlock();
    }
}

/// An address is found in a small hash table.
void lookUp(benchmark::State& state) {
    static std::array<int, 64> objects;
    std::unordered_map<void const*, int> table;
    for (int& object : objects)
        table.emplace(&object, 0);
    void const* object = &objects[objects.size() / 2];
    for (auto _ : state) {
        benchmark::DoNotOptimize(object);
        benchmark::DoNotOptimize(table.find(object));
    }
}

/// A small object is allocated and freed.
void allocation(benchmark::State& state) {
    for (auto _ : state) {
        auto* object = new std::array<char, 64>;
        benchmark::DoNotOptimize(object);
        delete object;
    }
}

/// A cache line that is found by reading another one before it, in memory of the size that 10,000
/// boards or lines take: more than a second-level cache has.
struct alignas(64) CacheLine {
    std::uint32_t next;
};

std::vector<CacheLine> scatteredLines() {
    std::vector<CacheLine> lines(80'000);
    std::vector<std::uint32_t> order(lines.size());
    std::iota(order.begin(), order.end(), 0U);
    std::ranges::shuffle(order, std::mt19937(1)); // NOLINT(*-msc51-cpp,*-msc32-c): the same always
    for (std::size_t i = 0; i < order.size(); ++i)
        lines[order[i]].next = order[(i + 1) % order.size()];
    return lines;
}

void cacheMiss(benchmark::State& state) {
    static auto const lines = scatteredLines();
    std::uint32_t at = 0;
    for (auto _ : state) {
        at = lines[at].next;
        benchmark::DoNotOptimize(at);
    }
}

BENCHMARK(lockPair)->Name(kLockPair);
BENCHMARK(lookUp)->Name(kLookUp);
BENCHMARK(allocation)->Name(kAllocation);
BENCHMARK(cacheMiss)->Name(kCacheMiss);

} // namespace
