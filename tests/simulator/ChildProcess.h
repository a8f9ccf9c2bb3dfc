// SPDX-License-Identifier: BSD-2-Clause
// A program that a test runs and talks to; every wait is bounded.
#pragma once

#include <sys/types.h>

#include <string>
#include <vector>

namespace kvlsim::testing {

/// What became of a program that ran to its end.
struct Finished {
    int status = -1; ///< exit status; 1000 and the signal's number where a signal ended it
    std::string out;
    std::string err;
};

class ChildProcess {
  public:
    /// `environment` ("NAME=value") comes on top of the test's own, in which KVLSIM_... are left
    /// out.
    ChildProcess(std::vector<std::string> const& command,
                 std::vector<std::string> const& environment);
    /// Ends a program that still runs.
    ~ChildProcess();
    ChildProcess(ChildProcess const&) = delete;
    ChildProcess& operator=(ChildProcess const&) = delete;

    void writeLine(std::string const& line);
    /// The next line of its standard output; "(end)" when there is none in time.
    std::string readLine();
    /// Closes its standard input and waits for its end. A program that does not end is killed.
    Finished finish();
    void kill();

  private:
    /// Reads what is there; false when both outputs are at their end or the time is over.
    bool readMore();

    pid_t m_pid = -1;
    int m_in = -1;
    int m_out = -1;
    int m_err = -1;
    std::string m_outText;
    std::string m_errText;
};

/// Runs a program to its end, its standard input empty.
Finished run(std::vector<std::string> const& command,
             std::vector<std::string> const& environment = {});

} // namespace kvlsim::testing
