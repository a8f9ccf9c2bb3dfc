// SPDX-License-Identifier: BSD-2-Clause
// Finds out what is wrong.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "agent/alarms/Alarm.h"
#include "agent/rows/Counters.h"
#include "agent/rows/Snapshot.h"

namespace kvloamd {

/// The identity of a board in alarms: its serial number, or "#<index>" for a board without one. A
/// board that is not known (index 0) is empty.
std::string alarmBoard(std::string const& serialNumber, std::uint32_t boardIndex);

/// "board NX50001"; "unknown board" for an empty `board`.
std::string boardResource(std::string const& board);

/// Where a board is, as far as it is known: "shelf 1, bus 2, slot 4"; empty without a slot.
std::string boardPlace(BoardRow const& board);

/// A condition of an interface; `board` is null when it is not known.
Condition interfaceCondition(AlarmKind kind, InterfaceRow const& row, BoardRow const* board);

/// What a bit of dsx1LineStatus means as an alarm.
struct LineAlarm {
    unsigned bit;
    AlarmKind kind;
};

/// The bits that are alarms. Loopbacks, test codes, and what a line sends are none.
std::vector<LineAlarm> const& lineAlarms();

/// What a snapshot shows to be wrong. `stopped` and `gone` are the present conditions of these two
/// kinds: only an event begins them, and the snapshot says whether they last.
std::vector<Condition> conditionsIn(Snapshot const& snapshot, std::vector<Condition> const& stopped,
                                    std::vector<Condition> const& gone);

/// A `HealthWatch` finds out what is wrong with the agent itself. Thread-bound: the alarm thread.
class HealthWatch {
  public:
    /// The age of a snapshot that counts as stale: three times the longest pause between refreshes.
    static constexpr std::chrono::seconds kStale{30};
    /// How long dropped notifications remain an alarm after the last one.
    static constexpr std::chrono::minutes kDropped{5};

    /// `counters` outlives the watch.
    explicit HealthWatch(Counters const& counters) : m_counters(counters) {}

    /// `journalFails`: the journal cannot be written.
    std::vector<Condition> conditions(Snapshot const& newest, Clock::time_point now,
                                      bool journalFails);

  private:
    Counters const& m_counters;
    std::uint32_t m_dropped = 0;
    std::optional<Clock::time_point> m_lastDropped;
};

} // namespace kvloamd
