// SPDX-License-Identifier: BSD-2-Clause
// Tests of the real agent with the real SNMP tools, over loopback.
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <gtest/gtest.h>

#include "agent/objects/Value.h"
#include "tests/e2e/Process.h"

namespace kvloamd::e2e {

struct Result {
    int status = 0;
    std::string output;
};

/// One line of a walk: "1.3.6.1 ... = STRING: x".
struct Answer {
    Oid name;
    std::string value;

    bool operator==(Answer const&) const = default;
};

/// Gives each test a directory and a simulated platform, and ends everything that it started.
class AgentFixture : public ::testing::Test {
  protected:
    AgentFixture();
    ~AgentFixture() override;

    /// Sets the SNMP configuration of agents started later. By default everybody on loopback may
    /// read.
    void configureSnmp(std::string const& text) { write(m_snmpConfig, text); }
    /// Sets the chassis of agents started later. By default it is the bundled chassis of three
    /// boards.
    void useChassis(std::string const& yaml);

    /// Starts the agent on a free port and waits until it serves.
    void startAgent(std::vector<std::string> const& arguments = {});
    /// Starts the agent with these arguments only; it need not serve yet.
    void launchAgent(std::vector<std::string> const& arguments);
    /// Starts the agent with these arguments only, waits for its end.
    Result runAgent(std::vector<std::string> const& arguments);
    Process& agent() { return *m_agent; }
    /// Ends the agent with SIGTERM. Returns its exit status.
    int stopAgent();

    /// Runs one of the SNMP tools against the agent. The names of KVL-OAM-MIB may be used.
    Result snmp(std::string const& tool, std::vector<std::string> const& arguments) const;
    /// The same with SNMPv2c, read access and numeric names.
    Result ask(std::string const& tool, std::vector<std::string> const& arguments) const;
    /// The same, with the answers read; expects success.
    std::vector<Answer> answers(std::string const& tool,
                                std::vector<std::string> const& arguments) const;
    std::vector<Answer> walk(std::string const& from = kObjects) const;
    /// The value of one instance, with names; such as "INTEGER: started(3)".
    std::string get(std::string const& name) const;

    /// From now on, programs that run snmpbulkwalk get other answers than the agent's: `edit` is a
    /// command of sed.
    void editWalks(std::string const& edit);

    /// Runs the simulator's control tool on the agent's platform; expects success.
    void sim(std::vector<std::string> const& arguments) const;
    /// Waits until `condition` holds.
    static bool eventually(std::function<bool()> const& condition);

    /// Starts to receive notifications. Before `startAgent`, whose configuration names the port.
    /// `output`: how it prints them; by default names of KVL-OAM-MIB, without types.
    void startTrapReceiver(std::string const& config,
                           std::vector<std::string> const& output = {"-M", MIB_PATH, "-m",
                                                                     "KVL-OAM-MIB", "-OQ"});
    /// Chooses the port of the receiver that is started later, so that `trapAddress` has it now.
    void chooseTrapPort() {
        m_trapPort = freePort();
        m_trapPortIsChosen = true;
    }
    Process& trapReceiver() { return *m_trapReceiver; }
    /// Starts a receiver of notifications of version 2c and the agent, which sends them there;
    /// `access` is what the community public gets.
    void startWithReceiver(std::string const& access = "rocommunity");

    /// A port at which nobody listens, neither by UDP nor by TCP.
    static int freePort();
    /// Whether a process on this host has bound the UDP port.
    static bool udpPortIsBound(int port);
    /// Directs the SNMP tools to this port of the loopback address.
    void askPort(int port) { m_port = port; }
    /// Sets an environment variable of children started later.
    void setVariable(std::string const& name, std::string const& value) {
        m_variables[name] = value;
    }
    std::string address() const { return "127.0.0.1:" + std::to_string(m_port); }
    std::string trapAddress() const { return "127.0.0.1:" + std::to_string(m_trapPort); }
    std::string path(std::string const& name) const { return m_folder + "/" + name; }
    std::string moduleDirectory() const;
    static void write(std::string const& file, std::string const& text);
    /// Runs any program; waits for its end.
    Result run(std::vector<std::string> const& command) const;

    /// Lets everybody on loopback read.
    static constexpr char kReader[] = "rocommunity public 127.0.0.1\n";
    static constexpr char kObjects[] = "1.3.6.1.4.1.32473.1";
    static constexpr char kBoards[] = "1.3.6.1.4.1.32473.1.1.2";
    static constexpr char kTable[] = "1.3.6.1.4.1.32473.1.1.2.4";

    /// The environment of children.
    Process::Environment environment() const;

  private:
    std::string m_folder;
    std::string m_snmpConfig;
    std::optional<std::string> m_chassis;
    Process::Environment m_variables;
    int m_port = 0;
    int m_trapPort = 0;
    bool m_trapPortIsChosen = false;
    std::unique_ptr<Process> m_trapReceiver;
    std::unique_ptr<Process> m_agent;
};

/// The lines of a tool that printed names as numbers.
std::vector<Answer> parseAnswers(std::string const& output);

} // namespace kvloamd::e2e
