// SPDX-License-Identifier: BSD-2-Clause
// A fault in a description.
#pragma once

#include <stdexcept>
#include <string>
#include <string_view>

namespace kvlsim {

/// A `ChassisError` says what is wrong with a description and what to do about it. `line()` is 0
/// where no line is known.
class ChassisError : public std::runtime_error {
  public:
    ChassisError(int line, std::string const& message)
        : std::runtime_error(message), m_line(line) {}
    int line() const { return m_line; }

  private:
    int m_line;
};

/// The error as one line: "source:line: message".
std::string describeError(std::string_view source, ChassisError const& error);

} // namespace kvlsim
