// SPDX-License-Identifier: BSD-2-Clause
// A descriptor by which threads wake another thread.
#pragma once

namespace kvloamd {

/// A `Wakeup` is a descriptor on which one thread polls and which other threads make readable. The
/// constructor throws std::system_error when no descriptor is available.
class Wakeup {
  public:
    Wakeup();
    ~Wakeup();
    Wakeup(Wakeup const&) = delete;
    Wakeup& operator=(Wakeup const&) = delete;

    int descriptor() const { return m_descriptor; }
    /// Makes the descriptor readable. Thread-safe.
    void wake();
    /// Makes the descriptor unreadable until the next `wake`.
    void clear();

  private:
    int m_descriptor;
};

} // namespace kvloamd
