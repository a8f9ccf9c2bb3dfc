// SPDX-License-Identifier: BSD-2-Clause
// The processes that the benchmark asks: agents of its own, and an SNMP master.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "Child.h"

/// An agent on a port of loopback, which serves once it is made.
class Agent {
  public:
    Agent(Agent const&) = delete;
    Agent& operator=(Agent const&) = delete;

    int port() const { return m_port; }
    std::string address() const { return "udp:127.0.0.1:" + std::to_string(m_port); }
    /// The processes that take part in an answer.
    virtual std::vector<pid_t> processes() const = 0;

  protected:
    Agent();
    ~Agent() = default;

    Folder m_folder;
    int m_port;
};

/// The agent with made-up intervals, stand-alone; beside them the peers' tables of the same.
class IntervalAgent final : public Agent {
  public:
    explicit IntervalAgent(std::uint32_t lines);

    std::vector<pid_t> processes() const override { return {m_process.process()}; }

  private:
    Child m_process;
};

/// An `snmpd` with two subagents of the same made-up intervals: ours, and one that serves them by
/// the table_data helper.
class MasterAgent final : public Agent {
  public:
    explicit MasterAgent(std::uint32_t lines);

    std::vector<pid_t> processes() const override {
        return {m_process->process(), m_ours->process(), m_peer->process()};
    }

  private:
    std::string m_master;
    std::unique_ptr<Child> m_process;
    std::unique_ptr<Child> m_ours;
    std::unique_ptr<Child> m_peer;
};

/// The agent with boards of the simulated platform, each with four lines of a full day, read by
/// the agent's own collector.
class ChassisAgent final : public Agent {
  public:
    /// `refreshes`: whether every request has the rows read anew, or none.
    ChassisAgent(int boards, bool refreshes);

    std::vector<pid_t> processes() const override { return {m_process.process()}; }

  private:
    Child m_process;
};
