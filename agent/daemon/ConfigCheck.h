// SPDX-License-Identifier: BSD-2-Clause
// Checks the SNMP configuration while the agent runs.
#pragma once

#include <chrono>
#include <optional>
#include <string>
#include <thread>

#include "agent/daemon/Options.h"
#include "agent/fronts/Wakeup.h"

namespace kvloamd {

/// A `ConfigCheck` lets a second process of this program read the SNMP configuration, because the
/// SNMP library cannot check a file without applying it. A thread of its own waits for that
/// process. Thread-bound to the SNMP thread.
class ConfigCheck {
  public:
    /// A check that takes longer fails.
    static constexpr std::chrono::seconds kPatience{30};

    /// `options`: those of the running agent.
    explicit ConfigCheck(Options const& options);
    /// Ends a check that is under way.
    ~ConfigCheck();
    ConfigCheck(ConfigCheck const&) = delete;
    ConfigCheck& operator=(ConfigCheck const&) = delete;

    /// Starts a check. If one is under way, another follows it, because the file may have changed
    /// since the first one read it.
    void start();
    /// Readable when a check has ended.
    int descriptor() const { return m_done.descriptor(); }
    /// What is wrong with the configuration, in one line; empty if it is good. Nothing while the
    /// last check that was started is not over.
    std::optional<std::string> take();

  private:
    void run();
    std::string check();

    std::string m_snmpConfig;
    Wakeup m_done;
    Wakeup m_cancelled;
    std::thread m_thread;
    bool m_isAskedAgain = false;
    std::string m_fault; ///< of the last check; written by the thread until it has woken `m_done`
};

} // namespace kvloamd
