// SPDX-License-Identifier: BSD-2-Clause
// Compares the agent with Net-SNMP's own table helpers, and with itself at other sizes.
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <benchmark/benchmark.h>

#include "Agents.h"
#include "Child.h"
#include "DelayReport.h"
#include "IntervalRows.h"
#include "LeanClient.h"
#include "RatioReporter.h"
#include "RefreshProcess.h"
#include "Requests.h"

namespace {

constexpr std::uint32_t kFewLines = 28;
constexpr std::uint32_t kManyLines = 280;
constexpr int kBoards[] = {125, 250, 500, 1000};

/// Asks all requests over and over.
class Asking {
  public:
    Asking(Agent const& agent, std::vector<std::string> requests)
        : m_client(agent.port()), m_requests(std::move(requests)) {
        // An agent may answer fewer variables than it is asked for.
        std::size_t variables = 0;
        for (std::string const& request : m_requests)
            variables += LeanClient::read(m_client.ask(request)).size();
        m_variablesOfARequest =
            static_cast<double>(variables) / static_cast<double>(m_requests.size());
    }

    void run(benchmark::State& state) {
        for (auto _ : state) {
            benchmark::DoNotOptimize(m_client.ask(m_requests[m_next]));
            // Few requests, too, come from all over the table.
            m_next = (m_next + kStride) % m_requests.size();
        }
        state.counters["items"] = m_variablesOfARequest;
    }

  private:
    static constexpr std::size_t kStride = 37;

    LeanClient m_client;
    std::vector<std::string> m_requests;
    double m_variablesOfARequest = 0;
    std::size_t m_next = 0;
};

void add(std::string const& name, std::function<void(benchmark::State&)> const& run) {
    benchmark::RegisterBenchmark(name.c_str(), run)->UseRealTime()->Unit(benchmark::kMicrosecond);
}

void addColumn(std::string const& name, Agent const& agent, kvloamd::Oid const& entry,
               std::uint32_t lines) {
    std::vector<std::string> requests;
    for (std::uint32_t const column : counterColumns())
        for (std::string& request : requestsFor(entry, {column}, lines))
            requests.push_back(std::move(request));
    auto const asking = std::make_shared<Asking>(agent, std::move(requests));
    add(name, [asking](benchmark::State& state) { asking->run(state); });
}

void addRow(std::string const& name, Agent const& agent, kvloamd::Oid const& entry) {
    auto const asking =
        std::make_shared<Asking>(agent, requestsFor(entry, counterColumns(), kFewLines));
    add(name, [asking](benchmark::State& state) { asking->run(state); });
}

void addWalk(std::string const& name, Agent const& agent, kvloamd::Oid const& entry) {
    std::string root;
    for (std::uint32_t const number : entry)
        root += "." + std::to_string(number);
    std::vector<std::string> const command{
        "snmpbulkwalk", "-v2c", "-c", "public", "-On", "-Cr50", "-t10", agent.address(), root};
    add(name, [command](benchmark::State& state) {
        for (auto _ : state)
            if (Child(command).wait() != 0) state.SkipWithError("the walk fails");
    });
}

/// A benchmark of wrong answers would be none.
void check(Agent const& agent, kvloamd::Oid const& entry, std::uint32_t lines) {
    LeanClient client(agent.port());
    checkTable(client, entry, lines);
}

void addRefresh(std::string const& name, RefreshProcess const& process) {
    benchmark::RegisterBenchmark(name.c_str(),
                                 [&](benchmark::State& state) {
                                     for (auto _ : state)
                                         state.SetIterationTime(process.refresh());
                                 })
        ->UseManualTime()
        ->Unit(benchmark::kMicrosecond);
}

int run(int argc, char** argv) {
    useOneProcessor();
    // Neither the tools nor the agents look for MIB files.
    setenv("MIBS", "", 1);
    IntervalAgent const few(kFewLines);
    IntervalAgent const many(kManyLines);
    MasterAgent const master(kFewLines);
    std::map<int, std::unique_ptr<RefreshProcess>> refreshes;
    for (int const boards : kBoards)
        refreshes[boards] = std::make_unique<RefreshProcess>(boards);

    kvloamd::Oid dataEntry = kTableDataPlace;
    dataEntry.push_back(1);
    kvloamd::Oid iteratorEntry = kIteratorPlace;
    iteratorEntry.push_back(1);
    check(few, kOurEntry, kFewLines);
    check(few, dataEntry, kFewLines);
    check(few, iteratorEntry, 1);
    check(many, kOurEntry, kManyLines);
    check(master, kOurEntry, kFewLines);
    check(master, dataEntry, kFewLines);

    addColumn("a column, table_data/ours", few, kOurEntry, kFewLines);
    addColumn("a column, table_data/peer", few, dataEntry, kFewLines);
    addColumn("a column, table_iterator/ours", few, kOurEntry, kFewLines);
    addColumn("a column, table_iterator/peer", few, iteratorEntry, kFewLines);
    addWalk("snmpbulkwalk, table_data/ours", few, kOurEntry);
    addWalk("snmpbulkwalk, table_data/peer", few, dataEntry);
    addColumn("a column, from 28 to 280 lines/ours", many, kOurEntry, kManyLines);
    addColumn("a column, from 28 to 280 lines/peer", few, kOurEntry, kFewLines);
    addColumn("a column through a master, table_data/ours", master, kOurEntry, kFewLines);
    addColumn("a column through a master, table_data/peer", master, dataEntry, kFewLines);
    addRow("through a master, ten columns at once or singly/ours", master, kOurEntry);
    addColumn("through a master, ten columns at once or singly/peer", master, kOurEntry, kFewLines);
    for (std::size_t i = 1; i < std::size(kBoards); ++i) {
        std::string const topic = "a refresh, from " + std::to_string(kBoards[i - 1]) + " to " +
                                  std::to_string(kBoards[i]) + " boards";
        addRefresh(topic + "/ours", *refreshes[kBoards[i]]);
        addRefresh(topic + "/peer", *refreshes[kBoards[i - 1]]);
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) return 2;
    RatioReporter reporter({
        {"a column, table_data/real_time", 1 / 2.5},
        {"a column, table_iterator/real_time", 1 / 40.0},
        {"snmpbulkwalk, table_data/real_time", 1 / 1.8},
        {"a column, from 28 to 280 lines/real_time", 1.15},
        {"a column through a master, table_data/real_time", 1.0},
        {"through a master, ten columns at once or singly/real_time", 1 / 4.0},
        {"a refresh, from 125 to 250 boards/manual_time", 2.2},
        {"a refresh, from 250 to 500 boards/manual_time", 2.2},
        {"a refresh, from 500 to 1000 boards/manual_time", 2.2},
    });
    benchmark::RunSpecifiedBenchmarks(&reporter);
    benchmark::Shutdown();
    bool const ratiosKept = reporter.printRatios();
    bool const delaysKept = reportDelays(1000);
    return ratiosKept && delaysKept ? 0 : 1;
}

} // namespace

int main(int argc, char** argv) {
    try {
        return run(argc, argv);
    } catch (std::exception const& error) {
        std::fprintf(stderr, "bench_agent: %s\n", error.what());
        return 1;
    }
}
