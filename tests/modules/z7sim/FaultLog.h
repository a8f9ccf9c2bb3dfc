// SPDX-License-Identifier: BSD-2-Clause
// What threads found wrong.
#pragma once

#include <mutex>
#include <string>

/// Keeps the first fault that a thread finds.
class FaultLog {
  public:
    void add(std::string const& fault) {
        std::scoped_lock const guard(m_mutex);
        if (m_first.empty()) m_first = fault;
    }
    std::string first() {
        std::scoped_lock const guard(m_mutex);
        return m_first;
    }

  private:
    std::mutex m_mutex;
    std::string m_first;
};
