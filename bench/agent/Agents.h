// SPDX-License-Identifier: BSD-2-Clause
// The processes that the benchmark asks: agents of its own, and an SNMP master.
#pragma once

#include <cstdint>
#include <memory>
#include <string>

#include "Child.h"

/// An agent on a port of loopback, which serves once it is made.
class Agent {
  public:
    int port() const { return m_port; }
    std::string address() const { return "udp:127.0.0.1:" + std::to_string(m_port); }

  protected:
    Agent();

    Folder m_folder;
    int m_port;
};

/// The agent with made-up intervals, stand-alone; beside them the peers' tables of the same.
class IntervalAgent : public Agent {
  public:
    explicit IntervalAgent(std::uint32_t lines);

  private:
    Child m_process;
};

/// An `snmpd` with two subagents of the same made-up intervals: ours, and one that serves them by
/// the table_data helper.
class MasterAgent : public Agent {
  public:
    explicit MasterAgent(std::uint32_t lines);

  private:
    std::string m_master;
    std::unique_ptr<Child> m_process;
    std::unique_ptr<Child> m_ours;
    std::unique_ptr<Child> m_peer;
};

/// The agent with boards of the simulated platform, each with four lines of a full day, read by
/// the agent's own collector.
class ChassisAgent : public Agent {
  public:
    /// `refreshes`: whether every request has the rows read anew, or none.
    ChassisAgent(int boards, bool refreshes);

  private:
    Child m_process;
};
