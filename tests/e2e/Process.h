// SPDX-License-Identifier: BSD-2-Clause
// A child process whose output the test reads.
#pragma once

#include <sys/types.h>

#include <chrono>
#include <map>
#include <string>
#include <vector>

namespace kvloamd::e2e {

/// The longest time that a test waits for anything. Only a failing test waits that long.
inline constexpr std::chrono::seconds kPatience{90};

/// A `Process` is a child process that the constructor starts and the destructor kills if it still
/// runs. Its standard output and error are read as one stream.
class Process {
  public:
    using Environment = std::map<std::string, std::string>;

    /// `environment` is the whole environment of the child. The program is searched on the test's
    /// PATH.
    Process(std::vector<std::string> const& command, Environment const& environment);
    ~Process();
    Process(Process const&) = delete;
    Process& operator=(Process const&) = delete;

    /// Reads until the whole output contains `text` at least `times` times. False when the output
    /// ends or `kPatience` is over.
    bool waitFor(std::string const& text, int times = 1);
    /// Whether the output contains `text` already.
    bool hasNow(std::string const& text);
    /// The end of the pipe from which the output is read; negative once it is closed.
    int pipe() const { return m_pipe; }
    /// Leaves the output unread for good: the process finds its reader gone.
    void closePipe();
    /// Reads to the end of the output, waits for the process, and returns its exit status; 128 and
    /// the signal when one ended it.
    int wait();
    void signal(int number) const;

    pid_t pid() const { return m_pid; }
    std::string const& output() const { return m_output; }

  private:
    /// False at the end of the output, or at the deadline.
    bool readMore(std::chrono::steady_clock::time_point deadline);

    pid_t m_pid = -1;
    int m_pipe = -1;
    bool m_running = true;
    std::string m_output;
};

std::vector<std::string> linesOf(std::string const& text);

} // namespace kvloamd::e2e
