// SPDX-License-Identifier: BSD-2-Clause
// Tests of the real agent beside a real SNMP master, over loopback.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include "tests/e2e/AgentFixture.h"

namespace kvloamd::e2e {

/// The SNMP tools ask the master. It is none of the host's: its configuration, socket, port and
/// state are the test's own.
class MasterFixture : public AgentFixture {
  protected:
    MasterFixture();
    ~MasterFixture() override;

    /// Starts the master, on the same port each time, and waits until it serves.
    void startMaster();
    /// Directs the SNMP tools to the master again.
    void askMaster() { askPort(m_masterPort); }
    Process& master() { return *m_master; }
    /// Ends the master at once.
    void killMaster();
    /// What the configuration of masters started later says beside the least.
    void configureMaster(std::string const& text) { m_config = text; }
    /// Where subagents reach masters started later.
    void useMasterAddress(std::string const& address) { m_address = address; }

    /// Starts the agent as a subagent; waits until it serves that many boards, which needs no
    /// master.
    void startSubagent(int boards = 3);
    /// Waits until the agent has said `times` times that it is connected.
    bool isConnected(int times = 1) {
        return agent().waitFor("kvloamd: connected to the SNMP master", times);
    }
    bool isLost(int times = 1) { return agent().waitFor("kvloamd: lost the SNMP master", times); }
    /// What the agent has said of its master so far, a word a line: "none", "connected", "lost".
    std::vector<std::string> statesTold();
    /// How often `text` stands in `output`.
    static int count(std::string const& output, std::string const& text);

  private:
    std::string m_address;
    std::string m_config;
    int m_masterPort = 0;
    std::unique_ptr<Process> m_master;
};

} // namespace kvloamd::e2e
