// SPDX-License-Identifier: BSD-2-Clause
#include "Agents.h"

#include <chrono>
#include <memory>

// The SNMP library's headers build on each other.
// clang-format off
#include <net-snmp/net-snmp-config.h>
#include <net-snmp/net-snmp-includes.h>
#include <net-snmp/agent/net-snmp-agent-includes.h>
// clang-format on

#include "BoardRefresh.h"
#include "IntervalRows.h"
#include "LeanClient.h"
#include "PeerTables.h"
#include "agent/fronts/agentx/Subagent.h"
#include "agent/fronts/snmp/StandAlone.h"
#include "agent/log/Log.h"
#include "agent/objects/ObjectTree.h"
#include "agent/objects/StandardObjects.h"
#include "agent/readers/Collector.h"
#include "agent/rows/Settings.h"

namespace {

using namespace kvloamd;

/// Serves the standard objects below `arc` until the process is ended.
void serveFrom(Front& front, Oid const& arc,
               std::function<std::shared_ptr<Snapshot const>()> const& takeSnapshot) {
    std::vector<Table const*> const tables = standardTables();
    ObjectTree const tree(standardScalars(), tables);
    Counters counters;
    Settings settings;
    front.serve({{{tree, arc, {{kOurPlace, "the intervals"}}}},
                 counters,
                 takeSnapshot,
                 takeSnapshot,
                 settings,
                 {}});
    front.run();
}

/// Files of the SNMP library in `folder`, which let everybody on this machine read.
SnmpFiles readableByAll(Folder const& folder) {
    setLogLevel(LogLevel::Error);
    folder.write("snmp.conf", "rocommunity public 127.0.0.1\n");
    return {folder.path("snmp.conf"), folder.path("state"), {}, {}};
}

int runIntervalAgent(Folder const& folder, std::string const& address, std::uint32_t lines) {
    StandAlone front({address}, readableByAll(folder));
    auto const snapshot = std::make_shared<Snapshot const>(makeIntervals(lines));
    if (!front.open()) return 1;
    serveByTableData(snapshot->interfaces);
    serveByIterator(snapshot->interfaces);
    serveFrom(front, kOurArc, [&] { return snapshot; });
    return 0;
}

int runSubagent(std::string const& master, std::uint32_t lines) {
    setLogLevel(LogLevel::Error);
    auto const snapshot = std::make_shared<Snapshot const>(makeIntervals(lines));
    Subagent front(*parseAgentxAddress(master));
    if (!front.open()) return 1;
    serveFrom(front, kOurArc, [&] { return snapshot; });
    return 0;
}

int runPeerSubagent(Folder const& folder, std::string const& master, std::uint32_t lines) {
    Snapshot const snapshot = makeIntervals(lines);
    setenv("SNMPCONFPATH", folder.path("none").c_str(), 1);
    setenv("SNMP_PERSISTENT_DIR", folder.path("peer").c_str(), 1);
    setenv("MIBS", "", 1);
    snmp_enable_calllog();
    netsnmp_ds_set_boolean(NETSNMP_DS_APPLICATION_ID, NETSNMP_DS_AGENT_ROLE, 1);
    netsnmp_ds_set_string(NETSNMP_DS_APPLICATION_ID, NETSNMP_DS_AGENT_X_SOCKET, master.c_str());
    init_agent("bench_peer");
    serveByTableData(snapshot.interfaces);
    init_snmp("bench_peer");
    for (;;)
        agent_check_and_process(1);
}

std::vector<std::string> masterCommand(Folder const& folder, std::string const& master,
                                       std::string const& address) {
    folder.write("snmpd.conf", "master agentx\nagentXSocket " + master +
                                   "\nrocommunity public 127.0.0.1\n[snmp] persistentDir " +
                                   folder.path("master") + "\n");
    return {"snmpd", "-f", "-Ln", "-C", "-c", folder.path("snmpd.conf"), address};
}

int runChassisAgent(Folder const& folder, std::string const& address, int boards, bool refreshes) {
    StandAlone front({address}, readableByAll(folder));
    if (!front.open()) return 1;
    BoardRefresh refresh(boards);
    // Their seconds, not readings, would be what delays requests most.
    CollectorPace pace{std::chrono::hours(1), std::chrono::milliseconds(0), std::chrono::hours(1)};
    if (refreshes) pace.requestAge = std::chrono::milliseconds(0);
    Collector collector(
        [&](Snapshot& snapshot) {
            refresh.let(Happened::Everything);
            refresh.read(snapshot);
        },
        Clock::now(), [] {}, pace);
    serveFrom(front, kOurArc, [&] { return collector.snapshot(); });
    return 0;
}

} // namespace

Agent::Agent() : m_port(freePort()) {}

IntervalAgent::IntervalAgent(std::uint32_t lines)
    : m_process([&] { return runIntervalAgent(m_folder, address(), lines); }) {
    LeanClient(port()).waitFor(kOurEntry);
}

MasterAgent::MasterAgent(std::uint32_t lines)
    : m_master("unix:" + m_folder.path("master.sock")),
      m_process(std::make_unique<Child>(masterCommand(m_folder, m_master, address()))) {
    LeanClient client(port());
    client.waitFor({1, 3, 6, 1, 2, 1, 1});
    m_ours = std::make_unique<Child>([&] { return runSubagent(m_master, lines); });
    m_peer = std::make_unique<Child>([&] { return runPeerSubagent(m_folder, m_master, lines); });
    client.waitFor(kOurEntry);
    client.waitFor(kTableDataPlace);
}

ChassisAgent::ChassisAgent(int boards, bool refreshes)
    : m_process([&] { return runChassisAgent(m_folder, address(), boards, refreshes); }) {
    LeanClient(port()).waitFor(kOurEntry);
}
