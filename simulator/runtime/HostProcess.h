// SPDX-License-Identifier: BSD-2-Clause
// Processes of this host: which they are, whether they still run, and children that only wait.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "simulator/base/Descriptor.h"

namespace kvlsim {

/// A `HostProcess` is a running process, distinct from a later one with the same id.
struct HostProcess {
    pid_t pid = 0;
    std::uint64_t startedAt = 0; ///< in the kernel's ticks since its start

    bool operator==(HostProcess const&) const = default;
};

/// The process with this id, unless it has ended; a zombie has ended.
std::optional<HostProcess> runningProcess(pid_t pid);
/// The file name of the program with which its command line begins; empty when it has none.
std::string programOf(pid_t pid);
/// All that run a program of this name, by process id.
std::vector<HostProcess> processesRunning(std::string const& program);

/// A `WaitingChild` is a child process that only waits until it is ended. It also ends when this
/// process ends, however that happens.
class WaitingChild {
  public:
    /// `name` stands first on its command line. Throws std::runtime_error.
    explicit WaitingChild(std::string const& name);
    /// Ends it and waits until it has.
    ~WaitingChild();
    WaitingChild(WaitingChild const&) = delete;
    WaitingChild& operator=(WaitingChild const&) = delete;

    HostProcess const& process() const { return m_process; }
    /// Whether it still runs; takes its exit status when it does not.
    bool runs();

  private:
    void end();

    HostProcess m_process;
    Descriptor m_lifeline; ///< the child reads from its other end
    bool m_reaped = false;
};

} // namespace kvlsim
