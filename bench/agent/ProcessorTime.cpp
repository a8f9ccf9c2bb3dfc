// SPDX-License-Identifier: BSD-2-Clause
#include "ProcessorTime.h"

#include <sys/resource.h>
#include <sys/time.h>

#include <ctime>
#include <stdexcept>
#include <utility>

#include "Rounds.h"

namespace {

double timeOf(clockid_t clock) {
    timespec used{};
    if (clock_gettime(clock, &used) != 0) throw std::runtime_error("a process has ended");
    return static_cast<double>(used.tv_sec) * 1e9 + static_cast<double>(used.tv_nsec);
}

double timeOf(timeval const& used) {
    return static_cast<double>(used.tv_sec) * 1e9 + static_cast<double>(used.tv_usec) * 1e3;
}

} // namespace

ProcessorTime::ProcessorTime(std::vector<pid_t> others)
    : m_others(std::move(others)), m_begun(nanoseconds()) {}

double ProcessorTime::nanoseconds() const {
    rusage ended{};
    getrusage(RUSAGE_CHILDREN, &ended);
    double sum = timeOf(CLOCK_PROCESS_CPUTIME_ID) + timeOf(ended.ru_utime) + timeOf(ended.ru_stime);
    for (pid_t const process : m_others) {
        clockid_t clock = 0;
        if (clock_getcpuclockid(process, &clock) != 0)
            throw std::runtime_error("a process has ended");
        sum += timeOf(clock);
    }
    return sum;
}

void ProcessorTime::enter(benchmark::State& state) const {
    state.counters[kTimeOfARun] =
        (nanoseconds() - m_begun) / static_cast<double>(state.iterations());
}
