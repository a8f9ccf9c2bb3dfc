// SPDX-License-Identifier: BSD-2-Clause
// Runs the library's benchmarks and prints the ratios to their peers.
#include <thread>

#include <benchmark/benchmark.h>

#include "HugePages.h"
#include "RatioReporter.h"

int main(int argc, char** argv) {
    startWithHugePages(argv);
    // Both sides drop their precautions while a process has never had a second thread; an agent
    // always has one.
    std::thread([] {}).join();

    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
    RatioReporter reporter({
        {"copy and drop", 2.2},
        {"copy and drop, own objects/threads:2", 2.2},
        {"copy and drop, one object/threads:2", 3.5},
        {"new object, first handle, drop", 2.0},
        {"new object, first handle, drop, two threads/threads:2", 4.0},
        {"made here, dropped there/real_time", 2.5},
        {"second handle from the pointer", 3.3},
        {"walk of 10,000 boards by index", 5.0},
        {"one administrative event to the agent's listener", 4.0},
        {"one status to all of 10,000 boards", 5.0},
        {"one second of 1,000 tables", 2.0},
        {"one second of 10,000 tables", 2.0},
        {"one second of 10,000 lines", 2.0},
        {"one second, from 1,000 to 10,000 lines", 12.0},
        {"one second, from 1,000 to 10,000 tables", 12.0},
        {"entry and removal, from 10,000 to 100,000 tables", 15.0},
    });
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    return reporter.printRatios() ? 0 : 1;
}
