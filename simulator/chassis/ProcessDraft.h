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

struct Counters {
    CounterValues start{};
    CounterRates rates{};

    /// The counters after so many seconds, each between 0 and the largest 32-bit number. No more
    /// events are on the queue than it holds, and no fewer were there at most than are there now.
    CounterValues after(double seconds) const;
};

enum class ProcessKind : std::uint8_t {
    self,    ///< the process that runs the platform
    child,   ///< started under a name, ends with the process
    command, ///< every process on the host whose program bears the name
    pid,     ///< one process on the host
};

struct ProcessDraft {
    ProcessKind kind = ProcessKind::self;
    std::string name; ///< of a child or command; a child's may be a path
    std::int32_t pid = 0;
    Counters counters;
};

/// What the process itself counts unless it is described.
Counters defaultCounters();

} // namespace kvlsim
