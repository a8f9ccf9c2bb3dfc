// SPDX-License-Identifier: BSD-2-Clause
#include "Rounds.h"

#include <sstream>
#include <string_view>
#include <utility>

#include <benchmark/benchmark.h>

namespace {

/// A `Collector` keeps what every benchmark took, and prints nothing.
class Collector final : public benchmark::BenchmarkReporter {
  public:
    bool ReportContext(Context const&) override { return true; }

    void ReportRuns(std::vector<Run> const& runs) override {
        for (Run const& run : runs)
            if (run.run_type == Run::RT_Iteration) m_round[run.run_name.str()] = taken(run);
    }

    Round take() { return std::move(m_round); }

  private:
    static Taken taken(Run const& run) {
        if (run.error_occurred) return {0, 1, run.error_message};
        // What several threads wait for each other counts, too.
        bool const inProcessorTime = run.threads == 1 && run.run_name.time_type.empty();
        double const seconds =
            inProcessorTime ? run.cpu_accumulated_time : run.real_accumulated_time;
        double const nanoseconds = seconds * 1e9 / static_cast<double>(run.iterations);
        return {counterOf(run, kTimeOfARun, nanoseconds), counterOf(run, kItems, 1), {}};
    }

    static double counterOf(Run const& run, char const* name, double otherwise) {
        auto const counter = run.counters.find(name);
        return counter == run.counters.end() ? otherwise : counter->second.value;
    }

    Round m_round;
};

void setOption(std::string option) {
    // The benchmark library keeps a pointer to the program's name.
    static char program[] = "bench";
    char* arguments[] = {program, option.data(), nullptr};
    int count = 2;
    benchmark::Initialize(&count, arguments);
}

/// A regular expression for this text.
std::string literally(std::string_view text) {
    std::string expression;
    for (char const letter : text) {
        if (std::string_view(R"(.[]\()*+?{}|^$)").find(letter) != std::string_view::npos)
            expression += '\\';
        expression += letter;
    }
    return expression;
}

} // namespace

std::vector<std::string> benchmarkNames() {
    std::stringstream listed;
    Collector collector;
    collector.SetOutputStream(&listed);
    setOption("--benchmark_list_tests=true");
    benchmark::RunSpecifiedBenchmarks(&collector);
    setOption("--benchmark_list_tests=false");
    std::vector<std::string> names;
    for (std::string name; std::getline(listed, name);)
        names.push_back(name);
    return names;
}

std::vector<Round> runInRounds(std::vector<std::string> const& names, int rounds) {
    std::string filter;
    for (std::string const& name : names)
        filter += (filter.empty() ? "^(" : "|") + literally(name);
    filter += ")$";
    std::vector<Round> all;
    for (int i = 0; i < rounds; ++i) {
        Collector collector;
        benchmark::RunSpecifiedBenchmarks(&collector, filter);
        all.push_back(collector.take());
    }
    return all;
}
