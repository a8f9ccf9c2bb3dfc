// SPDX-License-Identifier: BSD-2-Clause
// A process with a command line of the test's choice.
#pragma once

#include <csignal>
#include <string>

#include "tests/support/ChildProcess.h"

namespace sim {

/// A `NamedProcess` runs until it is ended, at the latest with the test; its name stands first on
/// its command line.
class NamedProcess {
  public:
    explicit NamedProcess(std::string const& name)
        : m_process(support::Program{"/bin/cat"}, {name}, {}) {
        // A process that has copied a line has its command line.
        m_process.writeLine("started");
        m_process.readLine();
    }

    pid_t pid() const { return m_process.pid(); }

    /// Kills the process; it stays, without a command line, until `end`.
    void die() const { m_process.killAndLeave(); }
    void end() {
        if (m_process.pid() < 0) return;
        m_process.kill();
        m_process.finish();
    }

  private:
    support::ChildProcess m_process;
};

} // namespace sim
