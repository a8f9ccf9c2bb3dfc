// SPDX-License-Identifier: BSD-2-Clause
// The reference table with very many objects: the longest single operation, and the memory.
//
// bench_references [ENTRIES [OBJECTS]]
//
// First a table of ENTRIES addresses is filled and emptied several times. Every operation is timed
// by itself, in processor time, so that nothing counts that other programs do. Then OBJECTS objects
// get two handles each, and the memory is read at each step. Ends with status 1 if one operation on
// the table took more than 100 us in at least half of the rounds.
#include <malloc.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <fstream>
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

/// The `Longest` of a series of operations, each timed by itself.
class Longest {
  public:
    template <class Operation>
    void time(Operation const& operation) {
        double const begun = processorTime();
        operation();
        double const time = processorTime() - begun;
        m_sum += time;
        m_longest = std::max(m_longest, time);
        ++m_count;
    }
    double longest() const { return m_longest; }
    double mean() const { return m_sum / m_count; }

  private:
    double m_longest = 0;
    double m_sum = 0;
    double m_count = 0;
};

double median(std::vector<double> values) {
    std::ranges::sort(values);
    return values[values.size() / 2];
}

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

/// `Rounds` are the times of one kind of operation, round by round.
struct Rounds {
    char const* what;
    std::vector<double> longest = {};
    std::vector<double> mean = {};

    void add(Longest const& round) {
        longest.push_back(round.longest());
        mean.push_back(round.mean());
    }
    bool print() const {
        bool const within = median(longest) <= kLongest;
        std::printf("%-24s %8.2f %10.1f %8.1f to %.1f%s\n", what, median(mean), median(longest),
                    *std::ranges::min_element(longest), *std::ranges::max_element(longest),
                    within ? "" : "  EXCEEDED");
        return within;
    }
};

bool measureOperations(std::size_t entries) {
    // The table looks at addresses only.
    std::vector<std::array<std::max_align_t, 2>> addresses(entries);
    auto const object = [&](std::size_t i) { return reinterpret_cast<Object*>(&addresses[i]); };
    OwnTable table;
    Rounds entry{"entry"};
    Rounds search{"search"};
    Rounds removal{"removal"};
    double const before = allocated();
    double full = 0;
    for (int round = 0; round < kRounds; ++round) {
        Longest entered;
        Longest found;
        Longest removed;
        for (std::size_t i = 0; i < entries; ++i)
            entered.time([&] { table.create_refinfo(object(i)); });
        full = allocated();
        for (std::size_t i = 0; i < entries; ++i)
            found.time([&] { table.get_refinfo(object(i)); });
        for (std::size_t i = 0; i < entries; ++i)
            removed.time([&] { table.destroy_refcount(object(i)); });
        entry.add(entered);
        search.add(found);
        removal.add(removed);
    }
    std::printf("%zu entries, us of processor time\n%-24s %8s %10s %8s\n", entries, "", "mean",
                "longest", "range of the longest");
    bool const entryKept = entry.print();
    bool const searchKept = search.print();
    bool const removalKept = removal.print();
    auto const number = static_cast<double>(entries);
    std::printf("bytes for each entry %.0f; after the removal %.0f\n", (full - before) / number,
                (allocated() - before) / number);
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
    std::printf("\n%-44s %10s %10s\n", "bytes for each of the objects", "allocated", "resident");
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
    bool const kept = measureOperations(numberOf(argc, argv, 1, 1'000'000));
    measureMemory(numberOf(argc, argv, 2, 100'000));
    return kept ? 0 : 1;
}
