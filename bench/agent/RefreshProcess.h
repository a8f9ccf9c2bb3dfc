// SPDX-License-Identifier: BSD-2-Clause
// Reads boards and lines anew in a process of its own, as often as it is asked to.
#pragma once

#include "BoardRefresh.h"
#include "Child.h"

class RefreshProcess {
  public:
    /// Returns once the boards are there.
    explicit RefreshProcess(int boards) : RefreshProcess(boards, connect()) {}
    ~RefreshProcess();
    RefreshProcess(RefreshProcess const&) = delete;
    RefreshProcess& operator=(RefreshProcess const&) = delete;

    /// Lets something happen and refreshes once; returns the processor's seconds that the refresh
    /// took.
    double refresh(Happened happened) const;

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
