// SPDX-License-Identifier: BSD-2-Clause
#include "tests/e2e/MasterFixture.h"

#include <csignal>
#include <filesystem>

namespace kvloamd::e2e {

MasterFixture::MasterFixture()
    : m_address("unix:" + path("master.sock")), m_masterPort(freePort()) {
    std::filesystem::create_directories(path("master/cert_indexes"));
    askPort(m_masterPort);
}

MasterFixture::~MasterFixture() = default;

void MasterFixture::startMaster() {
    // One log line for each request would fill the output pipe.
    write(path("snmpd.conf"), "master agentx\nagentXSocket " + m_address +
                                  "\ndontLogTCPWrappersConnects yes\n"
                                  "rocommunity public 127.0.0.1\n" +
                                  m_config);
    Process::Environment variables = environment();
    variables["SNMP_PERSISTENT_DIR"] = path("master");
    variables["MIBS"] = "";
    m_master = std::make_unique<Process>(
        std::vector<std::string>{"snmpd", "-f", "-Lo", "-C", "-c", path("snmpd.conf"),
                                 "udp:127.0.0.1:" + std::to_string(m_masterPort)},
        variables);
    ASSERT_TRUE(master().waitFor("NET-SNMP version")) << master().output();
    ASSERT_TRUE(eventually([this] { return udpPortIsBound(m_masterPort); })) << master().output();
}

void MasterFixture::killMaster() {
    master().signal(SIGKILL);
    master().wait();
}

void MasterFixture::startSubagent(int boards) {
    launchAgent({"--agentx", m_address, "--module", "z7sim", "--module-dir", moduleDirectory()});
    ASSERT_TRUE(agent().waitFor("kvloamd: serving " + std::to_string(boards) +
                                (boards == 1 ? " board" : " boards") + " through the SNMP master"))
        << agent().output();
}

std::vector<std::string> MasterFixture::statesTold() {
    std::vector<std::string> states;
    for (std::string const& line : linesOf(agent().output())) {
        if (line.starts_with("kvloamd: no connection to the SNMP master at"))
            states.emplace_back("none");
        if (line.starts_with("kvloamd: connected to the SNMP master"))
            states.emplace_back("connected");
        if (line.starts_with("kvloamd: lost the SNMP master")) states.emplace_back("lost");
    }
    return states;
}

int MasterFixture::count(std::string const& output, std::string const& text) {
    int found = 0;
    for (auto at = output.find(text); at != std::string::npos;
         at = output.find(text, at + text.size()))
        ++found;
    return found;
}

} // namespace kvloamd::e2e
