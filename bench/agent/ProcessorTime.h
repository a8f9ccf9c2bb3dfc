// SPDX-License-Identifier: BSD-2-Clause
// The processor time of all processes that take part in answering a request.
#pragma once

#include <sys/types.h>

#include <vector>

#include <benchmark/benchmark.h>

/// A `ProcessorTime` measures how much processor time this process, its ended children and some
/// other processes use after its construction. Other programs on the machine, which take the
/// processor in between, lengthen it little.
class ProcessorTime {
  public:
    explicit ProcessorTime(std::vector<pid_t> others);

    /// Makes the time so far, divided by the benchmark's runs, the time of a run.
    void enter(benchmark::State& state) const;

  private:
    double nanoseconds() const;

    std::vector<pid_t> m_others;
    double m_begun;
};
