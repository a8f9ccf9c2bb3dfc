// SPDX-License-Identifier: BSD-2-Clause
// Runs the library's benchmarks and compares them with their limits.
#include <thread>

#include "BenchRun.h"
#include "HugePages.h"

int main(int argc, char** argv) {
    startWithHugePages(argv);
    // Both sides drop their precautions while a process has never had a second thread; an agent
    // always has one.
    std::thread([] {}).join();

    constexpr double kBoards = 10'000;
    constexpr double kLines = 10'000;
    constexpr double kSecondHandles = 64;
    return runBenchmarks(
        argc, argv,
        {
            {"copy and drop", 1.3, "2 lock pairs", {{2, kLockPair}}},
            {"copy and drop, own objects/threads:2", 2.2},
            {"copy and drop, one object/threads:2", 3.5},
            {"new object, first handle, drop", 1.8},
            {"new object, first handle, drop",
             1.5,
             "3 lock pairs and an allocation",
             {{3, kLockPair}, {1, kAllocation}}},
            {"new object, first handle, drop, two threads/threads:2", 4.0},
            {"made here, dropped there/real_time", 2.5},
            {"second handle from the pointer",
             1.2,
             "3 lock pairs and a look-up",
             {{3, kLockPair}, {1, kLookUp}}},
            {"second handle, making only/manual_time",
             1.15,
             "2 lock pairs and a look-up, each",
             {{2 * kSecondHandles, kLockPair}, {kSecondHandles, kLookUp}}},
            {"walk of 10,000 boards by index", 4.0},
            {"walk of 10,000 boards by index",
             1.5,
             "4 lock pairs and a cache miss each",
             {{4 * kBoards, kLockPair}, {kBoards, kCacheMiss}}},
            {"one administrative event to the agent's listener", 3.0},
            {"one administrative event to the agent's listener",
             1.6,
             "31 lock pairs and 3 allocations",
             {{31, kLockPair}, {3, kAllocation}}},
            {"one status to all of 10,000 boards", 5.0},
            {"one second of 1,000 tables", 2.0},
            {"one second of 10,000 tables", 2.0},
            {"one second of 10,000 lines", 2.0},
            {"one second, from 1,000 to 10,000 lines",
             1.0,
             "10 x 1,000, a cache miss each",
             {{10, "one second, from 1,000 to 10,000 lines/peer"}, {kLines, kCacheMiss}}},
            {"one second, from 1,000 to 10,000 tables", 12.0},
            {"entry and removal, from 10,000 to 100,000 tables", 15.0},
        });
}
