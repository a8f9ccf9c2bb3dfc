// SPDX-License-Identifier: BSD-2-Clause
// A request that cannot be answered as asked.
#pragma once

#include <stdexcept>
#include <string>

namespace kvloamd {

/// Why there is no document, and the HTTP status that says so.
class HttpFault : public std::runtime_error {
  public:
    HttpFault(int status, std::string const& message)
        : std::runtime_error(message), m_status(status) {}

    int status() const { return m_status; }

  private:
    int m_status;
};

} // namespace kvloamd
