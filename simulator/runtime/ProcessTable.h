// SPDX-License-Identifier: BSD-2-Clause
// The processes that use the simulated runtime library, with their counters.
#pragma once

#include <chrono>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

#include "simulator/chassis/ProcessDraft.h"
#include "simulator/runtime/HostProcess.h"

namespace kvlsim {

/// A `ProcessError` says in one line why a process cannot be added or ended.
class ProcessError : public std::runtime_error {
    using std::runtime_error::runtime_error;
};

/// A `ListedProcess` is a process with the counters that the library shows now.
struct ListedProcess {
    pid_t pid = 0;
    ProcessKind kind = ProcessKind::self;
    std::string name; ///< the program's; empty when its command line is
    CounterValues counters{};
};

/// The `ProcessTable` is the list of the processes that use the simulated runtime library.
/// Thread-safe: one lock guards it all. Lock order: the processes, the chassis.
class ProcessTable {
  public:
    using Clock = std::chrono::nanoseconds();
    static constexpr std::size_t kCapacity = 1000;

    /// `described` returns the first processes; it is called at the first use.
    explicit ProcessTable(std::function<std::vector<ProcessDraft>()> described);

    /// Ends all children; the next use starts again with the described processes.
    void restart();
    /// Sets the clock of the counters, which start again; null: the steady clock.
    void setClock(Clock* clock);

    /// In the order in which they were described or added; those that have ended are left out.
    std::vector<ListedProcess> list();
    std::optional<ListedProcess> find(pid_t pid);

    /// Returns its process id, 0 for a command. Throws ProcessError.
    pid_t add(ProcessDraft const& draft);
    /// Ends a child, and takes any other but the process itself off the list. Throws ProcessError.
    void end(pid_t pid);
    /// All children and commands of this name; returns how many. Throws ProcessError.
    std::size_t end(std::string const& name);

  private:
    using Time = std::chrono::nanoseconds;

    struct Entry {
        ProcessDraft draft;
        Time since{};
        std::unique_ptr<WaitingChild> child; ///< of a child
        HostProcess process;                 ///< of the process itself or one by its id
        std::map<pid_t, std::pair<HostProcess, Time>> found; ///< of a command, when first seen

        /// 0 for a command.
        pid_t pid() const { return child ? child->process().pid : process.pid; }
    };

    void begin();
    void enter(ProcessDraft const& draft);
    void dropEnded();
    Time firstSeen(Entry& entry, HostProcess const& process) const;
    std::vector<ListedProcess> listed();
    static ListedProcess describe(Entry const& entry, pid_t pid, Time age);
    Time now() const;

    std::mutex m_mutex;
    std::function<std::vector<ProcessDraft>()> m_described;
    Clock* m_clock = nullptr;
    bool m_begun = false;
    std::vector<Entry> m_entries;
};

} // namespace kvlsim
