// SPDX-License-Identifier: BSD-2-Clause
// Alarms and the conditions that they come from.
#pragma once

#include <chrono>
#include <compare>
#include <cstdint>
#include <string>

#include "agent/alarms/AlarmKinds.h"
#include "agent/rows/Clock.h"

namespace kvloamd {

/// One time by both clocks. Durations are measured by `steady`; `date` is for people.
struct Instant {
    Clock::time_point steady;
    std::chrono::system_clock::time_point date;

    static Instant now() { return {Clock::now(), std::chrono::system_clock::now()}; }
};

/// What identifies an alarm, also after a restart of the agent.
struct AlarmKey {
    AlarmKind kind = AlarmKind::BoardFailed;
    std::string board; ///< its serial number; empty: the agent itself, or a board without one
    std::uint32_t number = 0; ///< ifIndex of an interface, value of a platform fault, else 0

    auto operator<=>(AlarmKey const&) const = default;
};

/// Something that is wrong now. It becomes an alarm when it has lasted long enough.
struct Condition {
    AlarmKey key;
    std::string resource;         ///< for people: "board NX50001, T1 line trunk-1"
    std::uint32_t boardIndex = 0; ///< 0: none, or not known any more
    std::uint32_t ifIndex = 0;    ///< 0: none
    std::string text;             ///< what was said about it last; may be empty
    std::string place;            ///< of a board that has gone: its slot; empty: not known
    std::uint32_t line = 0;       ///< of a channel: the ifIndex of its line; 0: not known

    bool operator==(Condition const&) const = default;
};

struct Alarm {
    Condition condition;
    AlarmSeverity severity = AlarmSeverity::Indeterminate;
    std::uint32_t number = 0; ///< of its raising among all events; never given twice
    std::chrono::system_clock::time_point began;   ///< the condition, for the first counted time
    std::chrono::system_clock::time_point raised;  ///< when it became an alarm
    std::chrono::system_clock::time_point cleared; ///< good when it has been cleared
    std::uint32_t count = 0; ///< how often the condition has begun, from `began` on
    /// What the condition follows from, such as "dsx1LossOfSignal on board NX50001, T1 line
    /// trunk-1"; empty: nothing.
    std::string cause;
};

/// What happens to an alarm. `Explained`: its condition turns out to follow from an alarm's, so it
/// is none, or none any more.
enum class AlarmEvent { Raised, Cleared, SeverityChanged, Explained };

} // namespace kvloamd
