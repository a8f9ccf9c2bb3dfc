// SPDX-License-Identifier: BSD-2-Clause
// A descriptor that one thread sleeps on and others make readable.
#pragma once

namespace kvloamd {

/// Throws std::system_error when the system has no descriptor left.
class Wakeup {
  public:
    Wakeup();
    ~Wakeup();
    Wakeup(Wakeup const&) = delete;
    Wakeup& operator=(Wakeup const&) = delete;

    int descriptor() const { return m_descriptor; }
    /// Makes the descriptor readable. Any thread.
    void wake();
    /// Makes the descriptor unreadable until the next `wake`.
    void clear();

  private:
    int m_descriptor;
};

} // namespace kvloamd
