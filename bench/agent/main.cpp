// SPDX-License-Identifier: BSD-2-Clause
// Compares the agent with Net-SNMP's own table helpers, and with itself at other sizes.
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <functional>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <benchmark/benchmark.h>

#include "Agents.h"
#include "BenchRun.h"
#include "Child.h"
#include "DelayReport.h"
#include "GrowthReport.h"
#include "HugePages.h"
#include "IntervalRows.h"
#include "LeanClient.h"
#include "ProcessorTime.h"
#include "Requests.h"
#include "Rounds.h"

namespace {

constexpr std::uint32_t kFewLines = 28;
constexpr std::uint32_t kManyLines = 280;

// Each process is started when the first benchmark needs it.

Agent const& few() {
    static IntervalAgent const agent(kFewLines);
    return agent;
}

Agent const& many() {
    static IntervalAgent const agent(kManyLines);
    return agent;
}

Agent const& master() {
    static MasterAgent const agent(kFewLines);
    return agent;
}

/// A table somewhere.
struct Target {
    Agent const& (*agent)();
    kvloamd::Oid entry;
    std::uint32_t lines;
};

/// Asks all requests over and over.
class Asking {
  public:
    Asking(Target const& target, std::vector<std::string> requests)
        : m_agent(target.agent()), m_client(m_agent.port()), m_requests(std::move(requests)) {
        // A benchmark of wrong answers would be none.
        checkTable(m_client, target.entry, 1);
        // An agent may answer fewer variables than it is asked for.
        std::size_t variables = 0;
        for (std::string const& request : m_requests)
            variables += LeanClient::read(m_client.ask(request)).size();
        m_variablesOfARequest =
            static_cast<double>(variables) / static_cast<double>(m_requests.size());
    }

    void run(benchmark::State& state) {
        ProcessorTime const time(m_agent.processes());
        for (auto _ : state) {
            benchmark::DoNotOptimize(m_client.ask(m_requests[m_next]));
            // Few requests, too, come from all over the table.
            m_next = (m_next + kStride) % m_requests.size();
        }
        time.enter(state);
        state.counters[kItems] = m_variablesOfARequest;
    }

  private:
    static constexpr std::size_t kStride = 37;

    Agent const& m_agent;
    LeanClient m_client;
    std::vector<std::string> m_requests;
    double m_variablesOfARequest = 0;
    std::size_t m_next = 0;
};

void add(std::string const& name, std::function<void(benchmark::State&)> const& run) {
    benchmark::RegisterBenchmark(name.c_str(), run)->UseRealTime()->Unit(benchmark::kMicrosecond);
}

void addRequests(std::string const& name, Target const& target,
                 std::vector<std::string> const& requests) {
    add(name, [=, asking = std::shared_ptr<Asking>()](benchmark::State& state) mutable {
        if (asking == nullptr) asking = std::make_shared<Asking>(target, requests);
        asking->run(state);
    });
}

/// The counters, one column after the other.
void addColumns(std::string const& name, Target const& target) {
    std::vector<std::string> requests;
    for (std::uint32_t const column : counterColumns())
        for (std::string& request : requestsFor(target.entry, {column}, target.lines))
            requests.push_back(std::move(request));
    addRequests(name, target, requests);
}

/// So many columns together; beyond the counters, some twice.
void addColumnsAtOnce(std::string const& name, Target const& target, std::size_t columns) {
    auto const counters = counterColumns();
    std::vector<std::uint32_t> together;
    for (std::size_t i = 0; i < columns; ++i)
        together.push_back(counters[i % counters.size()]);
    addRequests(name, target, requestsFor(target.entry, together, target.lines));
}

void addWalk(std::string const& name, Target const& target) {
    add(name, [=](benchmark::State& state) {
        std::string root;
        for (std::uint32_t const number : target.entry)
            root += "." + std::to_string(number);
        std::vector<std::string> const command{
            "snmpbulkwalk", "-v2c", "-c", "public", "-On", "-Cr50", target.agent().address(), root};
        ProcessorTime const time(target.agent().processes());
        for (auto _ : state)
            if (Child(command).wait() != 0) state.SkipWithError("the walk fails");
        time.enter(state);
    });
}

int run(int argc, char** argv) {
    useOneProcessor();
    // Neither the tools nor the agents look for MIB files.
    setenv("MIBS", "", 1);
    Target const ours{few, kOurEntry, kFewLines};
    Target const ourMany{many, kOurEntry, kManyLines};
    Target const ourThroughMaster{master, kOurEntry, kFewLines};
    Target const tableData{few, kTableDataEntry, kFewLines};
    Target const tableDataThroughMaster{master, kTableDataEntry, kFewLines};
    Target const iterator{few, kIteratorEntry, kFewLines};

    addColumns("a column, table_data/ours", ours);
    addColumns("a column, table_data/peer", tableData);
    addColumns("a column, table_iterator/ours", ours);
    addColumns("a column, table_iterator/peer", iterator);
    addWalk("snmpbulkwalk, table_data/ours", ours);
    addWalk("snmpbulkwalk, table_data/peer", tableData);
    addColumns("a column, from 28 to 280 lines/ours", ourMany);
    addColumns("a column, from 28 to 280 lines/peer", ours);
    addColumns("a column through a master, table_data/ours", ourThroughMaster);
    addColumns("a column through a master, table_data/peer", tableDataThroughMaster);
    for (std::size_t const columns : {2U, 5U, 10U, 20U}) {
        std::string const topic =
            "through a master, " + std::to_string(columns) + " columns at once or singly";
        addColumnsAtOnce(topic + "/ours", ourThroughMaster, columns);
        addColumns(topic + "/peer", ourThroughMaster);
    }
    addColumnsAtOnce("ten columns, through a master or alone/ours", ourThroughMaster, 10);
    addColumnsAtOnce("ten columns, through a master or alone/peer", ours, 10);
    addColumns("a column, through a master or alone/ours", ourThroughMaster);
    addColumns("a column, through a master or alone/peer", ours);
    return runBenchmarks(
        argc, argv,
        {
            {"a column, table_data/real_time", 1 / 2.5},
            {"a column, table_data/real_time", 10.0, "a round trip", {{1, kRoundTrip}}},
            {"a column, table_iterator/real_time", 1 / 40.0},
            {"snmpbulkwalk, table_data/real_time", 1 / 1.8},
            {"a column, from 28 to 280 lines/real_time", 1.15},
            {"a column through a master, table_data/real_time", 1.0},
            {"a column through a master, table_data/real_time",
             2.5,
             "1 round trip, 50 local ones",
             {{1, kRoundTrip}, {kRepetitions, kLocalRoundTrip}}},
            {"through a master, 10 columns at once or singly/real_time", 0.3},
        },
        [](Judgement& judgement) {
            reportGrowth(judgement);
            reportDelays(1000, judgement);
        });
}

} // namespace

int main(int argc, char** argv) {
    startWithHugePages(argv);
    try {
        return run(argc, argv);
    } catch (std::exception const& error) {
        std::fprintf(stderr, "bench_agent: %s\n", error.what());
        return 1;
    }
}
