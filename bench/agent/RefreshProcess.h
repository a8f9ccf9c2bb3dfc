// SPDX-License-Identifier: BSD-2-Clause
// Reads boards and lines anew in a process of its own, as often as it is asked to.
#pragma once

#include "Child.h"

class RefreshProcess {
  public:
    /// Returns once the boards are there.
    explicit RefreshProcess(int boards) : RefreshProcess(boards, connect()) {}
    ~RefreshProcess();
    RefreshProcess(RefreshProcess const&) = delete;
    RefreshProcess& operator=(RefreshProcess const&) = delete;

    /// Refreshes once; returns the processor's seconds that it took.
    double refresh() const;

  private:
    /// The two ends of a connection: this process's, and the child's.
    struct Ends {
        int ours;
        int theirs;
    };

    static Ends connect();
    RefreshProcess(int boards, Ends ends);

    int m_socket;
    Child m_process;
};
