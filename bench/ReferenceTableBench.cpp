// SPDX-License-Identifier: BSD-2-Clause
// The reference table with very many objects: the longest single operation, and the memory.
//
// bench_references [ENTRIES [OBJECTS]]
//
// First, OBJECTS objects get two handles each, and the memory is read at each step. Then a table of
// ENTRIES addresses is filled and emptied in several rounds, and every operation is timed by
// itself, in processor time. An operation that takes long for a reason of its own does so in every
// round, so that the shortest of its times counts; the others contain interrupts. Ends with status
// 1 if one operation on the table takes more than 100 us.
#include <malloc.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fstream>
#include <limits>
#include <thread>
#include <vector>

#include "core/ReferenceCounter.h"

namespace {

constexpr int kRounds = 5;
constexpr double kLongest = 100; ///< us

class Thing : public Object {
  public:
    Thing() : Object(false) {}
};

class OwnTable : public ReferenceTable {
  public:
    OwnTable() = default;
};

/// Of the thread, in microseconds.
double processorTime() {
    timespec time{};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &time);
    return static_cast<double>(time.tv_sec) * 1e6 + static_cast<double>(time.tv_nsec) / 1e3;
}

/// `Times` are those of the same series of operations in several rounds.
class Times {
  public:
    explicit Times(std::size_t operations)
        : m_shortest(operations, std::numeric_limits<float>::max()) {}

    template <class Operation>
    void time(std::size_t i, Operation const& operation) {
        double const begun = processorTime();
        operation();
        double const time = processorTime() - begun;
        m_sum += time;
        ++m_count;
        m_longest = std::max(m_longest, time);
        m_shortest[i] = std::min(m_shortest[i], static_cast<float>(time));
    }

    bool print(char const* what) const {
        auto const longest = static_cast<double>(*std::ranges::max_element(m_shortest));
        bool const within = longest <= kLongest;
        std::printf("%-24s %8.2f %10.1f %28.1f%s\n", what, m_sum / m_count, longest, m_longest,
                    within ? "" : "  EXCEEDED");
        return within;
    }

  private:
    std::vector<float> m_shortest; ///< of each operation
    double m_longest = 0;
    double m_sum = 0;
    double m_count = 0;
};

/// Bytes that the program has allocated.
double allocated() {
    auto const memory = mallinfo2();
    return static_cast<double>(memory.uordblks + memory.hblkhd);
}

/// Bytes of physical memory that the program has.
double resident() {
    std::ifstream statm("/proc/self/statm");
    double total = 0;
    double pages = 0;
    statm >> total >> pages;
    return pages * static_cast<double>(sysconf(_SC_PAGESIZE));
}

bool measureOperations(std::size_t entries) {
    // The table looks at addresses only.
    std::vector<std::array<std::max_align_t, 2>> addresses(entries);
    auto const object = [&](std::size_t i) { return reinterpret_cast<Object*>(&addresses[i]); };
    Times entry(entries);
    Times search(entries);
    Times removal(entries);
    double const before = allocated();
    double full = 0;
    double empty = 0;
    for (int round = 0; round < kRounds; ++round) {
        OwnTable table;
        for (std::size_t i = 0; i < entries; ++i)
            entry.time(i, [&] { table.create_refinfo(object(i)); });
        full = allocated();
        for (std::size_t i = 0; i < entries; ++i)
            search.time(i, [&] { table.get_refinfo(object(i)); });
        for (std::size_t i = 0; i < entries; ++i)
            removal.time(i, [&] { table.destroy_refcount(object(i)); });
        empty = allocated();
    }
    std::printf("\n%-24s %8s %10s %28s\n", "one operation, us", "mean", "longest",
                "longest with interrupts");
    bool const entryKept = entry.print("entry");
    bool const searchKept = search.print("search");
    bool const removalKept = removal.print("removal");
    auto const number = static_cast<double>(entries);
    std::printf("bytes for each entry %.0f; after the removal %.0f\n", (full - before) / number,
                (empty - before) / number);
    return entryKept && searchKept && removalKept;
}

void printBytes(char const* what, double bytes, double residentBytes, double objects) {
    std::printf("%-44s %10.0f %10.0f\n", what, bytes / objects, residentBytes / objects);
}

void measureMemory(std::size_t objects) {
    using Handle = ReferenceCounter<Thing>;
    auto const number = static_cast<double>(objects);
    std::vector<Handle> first;
    std::vector<Handle> second;
    double const before = allocated();
    double const residentBefore = resident();
    first.reserve(objects);
    for (std::size_t i = 0; i < objects; ++i)
        first.emplace_back(new Thing);
    double const one = allocated();
    double const residentOne = resident();
    second.reserve(objects);
    for (Handle const& handle : first)
        second.emplace_back(handle);
    double const two = allocated();
    double const residentTwo = resident();
    std::printf("%-44s %10s %10s\n", "bytes for each of the objects", "allocated", "resident");
    printBytes("an object with its first handle", one - before, residentOne - residentBefore,
               number);
    printBytes("a further handle", two - one, residentTwo - residentOne, number);
    second = {};
    first = {};
    printBytes("when all are gone", allocated() - before, resident() - residentBefore, number);
}

std::size_t numberOf(int argc, char** argv, int argument, std::size_t otherwise) {
    return argc > argument ? std::strtoul(argv[argument], nullptr, 10) : otherwise;
}

} // namespace

int main(int argc, char** argv) {
    std::thread([] {}).join(); // an agent has more than one thread
    measureMemory(numberOf(argc, argv, 2, 100'000));
    return measureOperations(numberOf(argc, argv, 1, 1'000'000)) ? 0 : 1;
}
