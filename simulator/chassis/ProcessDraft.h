// SPDX-License-Identifier: BSD-2-Clause
// The processes of the runtime library as a chassis describes them, and their counters.
#pragma once

#include <array>
#include <cstdint>
#include <string>
#include <string_view>

namespace kvlsim {

/// The names of the counters, in the order in which the platform's record has them.
inline constexpr std::array<std::string_view, 7> kCounterNames = {
    "NumberOfOpens",    "NumberOfCloses",    "EventQueueSize",  "CurrentEventsOnQueue",
    "MaxEventsOnQueue", "TotalQueuedEvents", "NumberOfHandlers"};

using CounterValues = std::array<std::int32_t, kCounterNames.size()>;
/// Changes per second.
using CounterRates = std::array<double, kCounterNames.size()>;

/// `Counters` are the counters of a process at its start, and how they change.
struct Counters {
    CounterValues start{};
    CounterRates rates{};

    /// The counters after so many seconds, each between 0 and the largest 32-bit number. The events
    /// on the queue never exceed its size, and their maximum is never below their number.
    CounterValues after(double seconds) const;
};

/// How a process of the runtime library is chosen.
enum class ProcessKind : std::uint8_t {
    self,    ///< the process that runs the platform
    child,   ///< started under a name, ends with the process
    command, ///< every process on the host whose program has the name
    pid,     ///< one process on the host
};

/// A `ProcessDraft` is a process, or all processes of a command, as it is described.
struct ProcessDraft {
    ProcessKind kind = ProcessKind::self;
    std::string name; ///< of a child or command; a child's may be a path
    std::int32_t pid = 0;
    Counters counters;
};

/// What the process itself counts unless it is described.
Counters defaultCounters();

} // namespace kvlsim
