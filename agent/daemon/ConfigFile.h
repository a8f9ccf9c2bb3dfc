// SPDX-License-Identifier: BSD-2-Clause
// The syntax of the agent's configuration file.
#pragma once

#include <istream>
#include <map>
#include <set>
#include <stdexcept>
#include <string>

namespace kvloamd {

/// A fault in the configuration file.
class ConfigFault : public std::runtime_error {
  public:
    ConfigFault(int line, std::string const& text) : std::runtime_error(text), m_line(line) {}

    int line() const { return m_line; }

  private:
    int m_line; ///< from 1
};

/// Checks the lines of a configuration file. Each line is empty, a comment that begins with `#`, or
/// `key = value`, where the value is a word, a quoted text, or a list of these in brackets that
/// ends on its line. Returns the line number of each key. Throws ConfigFault for the first fault,
/// including a key that is not in `keys` or that appears twice.
std::map<std::string, int> checkConfigFile(std::istream& file, std::set<std::string> const& keys);

} // namespace kvloamd
