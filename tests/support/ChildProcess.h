// SPDX-License-Identifier: BSD-2-Clause
// A program that a test runs and talks to; every wait is bounded.
#pragma once

#include <sys/types.h>

#include <csignal>
#include <string>
#include <vector>

namespace support {

/// How a program ended.
struct Finished {
    int status = -1; ///< exit status, or 1000 plus the number of the signal that ended it
    std::string out;
    std::string err;
};

/// The file to run where the first word of the command line is another.
struct Program {
    std::string path;
};

/// A `ChildProcess` is a program that a test runs; every wait for it is bounded. Unsynchronised.
class ChildProcess {
  public:
    /// `environment` ("NAME=value") is added to the test's own, without its KVLSIM_ variables.
    ChildProcess(std::vector<std::string> const& command,
                 std::vector<std::string> const& environment);
    /// The child sees `environment` only.
    ChildProcess(Program const& program, std::vector<std::string> command,
                 std::vector<std::string> environment);
    /// Kills a program that still runs.
    ~ChildProcess();
    ChildProcess(ChildProcess const&) = delete;
    ChildProcess& operator=(ChildProcess const&) = delete;

    /// -1 after `finish`.
    pid_t pid() const { return m_pid; }
    void writeLine(std::string const& line);
    /// The next line of its standard output; "(end)" when none comes in time.
    std::string readLine();
    /// Closes its standard input and waits for its end. A program that does not end is killed.
    Finished finish();
    void kill() { signal(SIGKILL); }
    void signal(int number) const;
    /// Kills the program and waits until it has ended, without reaping it.
    void killAndLeave() const;

  private:
    /// Reads what is there; false when both outputs have ended or the time is over.
    bool readMore();

    pid_t m_pid = -1;
    int m_in = -1;
    int m_out = -1;
    int m_err = -1;
    std::string m_outText;
    std::string m_errText;
};

/// Runs a program to its end, with empty standard input.
Finished run(std::vector<std::string> const& command,
             std::vector<std::string> const& environment = {});

} // namespace support
