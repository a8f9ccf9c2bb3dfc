// SPDX-License-Identifier: BSD-2-Clause
// Tests of the real agent beside a real SNMP master, over loopback.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {

/// Adds a master, with its own configuration, socket, port and state. The SNMP tools ask the
/// master.
class MasterFixture : public AgentFixture {
  protected:
    MasterFixture();
    ~MasterFixture() override;

    /// Starts the master, on the same port each time, and waits until it serves.
    void startMaster();
    /// Directs the SNMP tools to the master again.
    void askMaster() { askPort(m_masterPort); }
    Process& master() { return *m_master; }
    /// Kills the master.
    void killMaster();
    /// Adds lines to the configuration of masters started later.
    void configureMaster(std::string const& text) { m_config = text; }
    /// Sets the AgentX address of masters started later.
    void useMasterAddress(std::string const& address) { m_address = address; }

    /// Starts the agent as a subagent and waits until it serves that many boards. Needs no master.
    void startSubagent(int boards = 3);
    /// Waits until the agent has logged `times` times that it is connected.
    bool isConnected(int times = 1) {
        return agent().waitFor("kvloamd: connected to the SNMP master", times);
    }
    bool isLost(int times = 1) { return agent().waitFor("kvloamd: lost the SNMP master", times); }
    /// The agent's log lines about its master so far, as "none", "connected" or "lost".
    std::vector<std::string> statesTold();
    /// How often `output` contains `text`.
    static int count(std::string const& output, std::string const& text);

  private:
    std::string m_address;
    std::string m_config;
    int m_masterPort = 0;
    std::unique_ptr<Process> m_master;
};

} // namespace kvloamd::e2e
