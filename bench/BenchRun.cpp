// SPDX-License-Identifier: BSD-2-Clause
#include "BenchRun.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <exception>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

#include <benchmark/benchmark.h>

#include "Baseline.h"
#include "Rounds.h"

namespace {

constexpr char const* kUsage =
    "usage: %s [--rounds N] [--baseline FILE] [--save-baseline FILE] [--benchmark_filter=REGEX]\n"
    "  --rounds N            run every benchmark N times (9)\n"
    "  --baseline FILE       also compare the times with those of FILE\n"
    "  --save-baseline FILE  write the times to FILE\n";

struct Options {
    int rounds = 9;
    std::string baseline;
    std::string saveBaseline;
};

/// Takes our options from what the benchmark library has left. Nothing if there is a wrong one.
std::optional<Options> readOptions(int argc, char** argv) {
    Options options;
    for (int i = 1; i < argc; ++i) {
        std::string const option = argv[i];
        if (++i == argc) return {};
        std::string const value = argv[i];
        if (option == "--rounds")
            options.rounds = std::atoi(value.c_str());
        else if (option == "--baseline")
            options.baseline = value;
        else if (option == "--save-baseline")
            options.saveBaseline = value;
        else
            return {};
    }
    if (options.rounds < 1) return {};
    return options;
}

std::string now() {
    std::time_t const seconds = std::time(nullptr);
    std::tm date{};
    gmtime_r(&seconds, &date);
    char text[32];
    std::strftime(text, sizeof text, "%Y-%m-%dT%H:%M:%SZ", &date);
    return text;
}

/// `name` without the first `part`, or nothing if it has none.
std::optional<std::string> without(std::string const& name, std::string const& part,
                                   std::string const& instead = {}) {
    auto const at = name.find(part);
    if (at == std::string::npos) return {};
    return std::string(name).replace(at, part.size(), instead);
}

std::string topicOf(std::string const& benchmark) {
    return without(benchmark, "/ours").value_or(benchmark);
}

std::string groupOf(std::string const& benchmark) {
    return benchmark.substr(0, benchmark.find('/'));
}

/// A `Group` are benchmarks that run in turns.
class Group {
  public:
    /// Runs them, with the floors of their limits.
    Group(std::vector<std::string> names, std::vector<Limit> const& limits, int rounds)
        : m_names(std::move(names)), m_limits(limits) {
        std::vector<std::string> all = m_names;
        for (std::string const& name : m_names)
            for (Limit const& limit : limits)
                if (limit.topic == topicOf(name))
                    for (Runs const& runs : limit.floor)
                        all.push_back(runs.benchmark);
        m_rounds = runInRounds(all, rounds);
    }

    void enter(Judgement& judgement) const {
        for (std::string const& name : m_names) {
            if (std::string const why = failureOf(name); !why.empty()) {
                judgement.addFailure(name, why);
                continue;
            }
            judgement.addTime(name, spreadOf(inEachRound([&](Round const& round) {
                                  return round.at(name).nanoseconds;
                              })));
            enterRatios(judgement, name);
        }
    }

  private:
    /// Enters the ratios of the benchmark `name` to its peer and its floors.
    void enterRatios(Judgement& judgement, std::string const& name) const {
        std::string const topic = topicOf(name);
        bool hasPeerLimit = false;
        for (Limit const& limit : m_limits) {
            // A peer's name is no topic.
            if (limit.topic != topic) continue;
            if (limit.floor.empty()) {
                hasPeerLimit = true;
                enterPeer(judgement, name, limit.factor);
            } else if (std::string const why = failureOf(limit.floor); !why.empty()) {
                judgement.addFailure(topic + " in units of " + limit.unit, why);
            } else {
                auto const ratios = inEachRound([&](Round const& round) {
                    double sum = 0;
                    for (Runs const& runs : limit.floor)
                        sum += runs.count * round.at(runs.benchmark).nanoseconds;
                    return round.at(name).nanoseconds / sum;
                });
                judgement.addRatio(topic, limit.unit, spreadOf(ratios), limit.factor);
            }
        }
        if (!hasPeerLimit) enterPeer(judgement, name, {});
    }

    void enterPeer(Judgement& judgement, std::string const& name,
                   std::optional<double> limit) const {
        auto const peer = without(name, "/ours", "/peer");
        if (!peer || !failureOf(*peer).empty()) {
            if (limit) judgement.addFailure(name, "it has no peer");
            return;
        }
        auto const ratios = inEachRound([&](Round const& round) {
            Taken const& ours = round.at(name);
            Taken const& theirs = round.at(*peer);
            return ours.nanoseconds / ours.items / (theirs.nanoseconds / theirs.items);
        });
        judgement.addRatio(topicOf(name), "its peer", spreadOf(ratios), limit);
    }

    template <class Value>
    std::vector<double> inEachRound(Value value) const {
        std::vector<double> values;
        for (Round const& round : m_rounds)
            values.push_back(value(round));
        return values;
    }

    /// Why the benchmark has not measured something in every round; empty if it has.
    std::string failureOf(std::string const& name) const {
        for (Round const& round : m_rounds) {
            auto const found = round.find(name);
            if (found == round.end()) return "there is no benchmark " + name;
            if (!found->second.failure.empty()) return found->second.failure;
        }
        return {};
    }
    std::string failureOf(std::vector<Runs> const& floor) const {
        for (Runs const& runs : floor)
            if (std::string why = failureOf(runs.benchmark); !why.empty()) return why;
        return {};
    }

    std::vector<std::string> m_names;
    std::vector<Limit> const& m_limits;
    std::vector<Round> m_rounds;
};

/// A limit that no benchmark is compared with would never be exceeded.
void checkTopics(std::vector<Limit> const& limits, std::vector<std::string> const& names,
                 Judgement& judgement) {
    std::string const filter = benchmark::GetBenchmarkFilter();
    if (!filter.empty() && filter != "all") return;
    for (Limit const& limit : limits)
        if (std::ranges::find(names, limit.topic, topicOf) == names.end())
            judgement.addFailure(limit.topic, "there is no such benchmark");
}

void runGroups(std::vector<Limit> const& limits, int rounds, Judgement& judgement) {
    std::vector<std::string> names = benchmarkNames();
    checkTopics(limits, names, judgement);
    while (!names.empty()) {
        std::string const group = groupOf(names.front());
        std::vector<std::string> members;
        std::erase_if(names, [&](std::string const& name) {
            bool const isMember = groupOf(name) == group;
            if (isMember) members.push_back(name);
            return isMember;
        });
        std::fprintf(stderr, "measuring: %s\n", group.c_str());
        Group(members, limits, rounds).enter(judgement);
    }
}

int measure(std::string const& program, Options const& options, std::vector<Limit> const& limits,
            std::function<void(Judgement&)> const& more) {
    std::string const machine = machineName();
    std::optional<Baseline> before;
    if (!options.baseline.empty()) before = loadBaseline(options.baseline, program, machine);
    Judgement judgement(std::move(before));
    double load = 0;
    getloadavg(&load, 1);
    std::printf("%s; %d rounds; %.1f processes ran in the last minute\n\n", machine.c_str(),
                options.rounds, load);
    runGroups(limits, options.rounds, judgement);
    if (more) more(judgement);
    std::printf("\n%s", judgement.text().c_str());
    if (!options.saveBaseline.empty()) {
        if (judgement.hasFailures())
            throw std::runtime_error(options.saveBaseline + ": not written, because not everything "
                                                            "was measured");
        saveBaseline({program, machine, now(), judgement.times()}, options.saveBaseline);
    }
    return judgement.exitStatus();
}

} // namespace

int runBenchmarks(int argc, char** argv, std::vector<Limit> const& limits,
                  std::function<void(Judgement&)> const& more) {
    char const* const slash = std::strrchr(argv[0], '/');
    std::string const program = slash == nullptr ? argv[0] : slash + 1;
    // Short runs, so that there can be many rounds; the user's option counts. Repetitions are
    // rounds.
    std::vector<char*> arguments(argv, argv + argc);
    std::string shortRuns = "--benchmark_min_time=0.1";
    std::string once = "--benchmark_repetitions=1";
    arguments.insert(arguments.begin() + 1, shortRuns.data());
    arguments.push_back(once.data());
    arguments.push_back(nullptr);
    int count = argc + 2;
    benchmark::Initialize(&count, arguments.data());
    auto const options = readOptions(count, arguments.data());
    if (!options) {
        std::fprintf(stderr, kUsage, program.c_str());
        return kUnusable;
    }
    int status = kUnusable;
    try {
        status = measure(program, *options, limits, more);
    } catch (std::exception const& error) {
        std::fprintf(stderr, "%s: %s\n", program.c_str(), error.what());
    }
    benchmark::Shutdown();
    return status;
}
