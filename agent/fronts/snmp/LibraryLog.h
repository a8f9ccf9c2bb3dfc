// SPDX-License-Identifier: BSD-2-Clause
// The messages of the SNMP library.
#pragma once

#include <string>
#include <vector>

namespace kvloamd {

/// Sends the library's messages to the agent's log from now on, one line for each, and limits
/// similar ones. Call it before the library is started.
void takeLibraryLog();

/// A `LibraryFaults` object collects the errors of a configuration that the library reads while it
/// exists, instead of logging them. Only one exists at a time. Thread-bound to the SNMP thread.
class LibraryFaults {
  public:
    LibraryFaults();
    ~LibraryFaults();
    LibraryFaults(LibraryFaults const&) = delete;
    LibraryFaults& operator=(LibraryFaults const&) = delete;

    /// One line for each error, in their order.
    std::vector<std::string> const& lines() const { return m_lines; }
    /// Whether the library has reported that no community and no user is configured.
    bool nobodyMayAsk() const { return m_nobodyMayAsk; }
    /// Takes a message; false if it is not about the configuration.
    bool take(std::string const& text);

  private:
    std::vector<std::string> m_lines;
    bool m_nobodyMayAsk = false;
};

} // namespace kvloamd
