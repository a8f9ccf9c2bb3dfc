// SPDX-License-Identifier: BSD-2-Clause
// The alarms that are active, and the rules by which conditions become alarms.
#pragma once

#include <array>
#include <cstddef>
#include <deque>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "agent/alarms/Alarm.h"
#include "agent/alarms/AlarmPolicies.h"

namespace kvloamd {

/// An `AlarmList` turns conditions into alarms.
///
/// A condition is present or absent. Its alarm is raised when the condition has been present for
/// the kind's raise hold, and cleared when it has been absent for the clear hold. A condition that
/// begins `kFlaps` times within `kFlapWindow` flaps: its alarm is raised at once, and is not
/// cleared before the condition has been absent for `kFlapWindow`, too. Every beginning of a
/// condition is counted: in an alarm's `count`, or in `suppressed` if it never became an alarm.
///
/// A condition that follows from another (`causesOf`) is a consequence. While its cause is present
/// or its cause's alarm is raised, it is no alarm, and ceases to be one if it came first. When the
/// cause has gone and the consequence has not, its raise hold begins anew. A cause whose kind is
/// switched off has no consequences.
///
/// Conditions arrive in two ways. Events report each beginning and end at once, so that nothing is
/// missed, however short. A comparison with everything that is wrong in a snapshot corrects what no
/// event reported; an event that is newer than the snapshot takes precedence.
///
/// All times are arguments. Thread-safe.
class AlarmList {
  public:
    static constexpr std::size_t kFlaps = 3;
    static constexpr std::chrono::seconds kFlapWindow{60};
    /// Conditions that are followed at the same time. Further ones are counted, not followed.
    static constexpr std::size_t kCapacity = 32768;
    /// Cleared alarms that are remembered.
    static constexpr std::size_t kClearedCapacity = 1000;

    /// Called for every event of an alarm, in order, while the list is locked: it must neither
    /// block nor use the list. Returns the event's sequence number, which becomes the `number` of
    /// an alarm that is raised.
    using Report = std::function<std::uint32_t(AlarmEvent, Alarm const&)>;

    struct Counts {
        std::uint32_t begun = 0;      ///< beginnings of conditions
        std::uint32_t raised = 0;     ///< alarms
        std::uint32_t cleared = 0;    ///< alarms
        std::uint32_t suppressed = 0; ///< beginnings that never became an alarm
        std::uint32_t unlisted = 0;   ///< beginnings that found the list full
        std::optional<Clock::time_point> lastRaised;
        std::optional<Clock::time_point> lastCleared;
    };
    /// What has been counted of one kind since the list was made.
    struct KindCounts {
        std::uint64_t raised = 0;  ///< alarms
        std::uint64_t cleared = 0; ///< alarms
        std::uint32_t active = 0;  ///< now
        Clock::duration lasted{0}; ///< how long its alarms were active until `counted`, added up
        Clock::time_point counted;
    };
    struct Active {
        Alarm alarm;
        bool present = true; ///< the condition; false: the alarm is held
    };
    /// Everything that is shown, as it was at one time.
    struct Contents {
        std::uint64_t version = 0; ///< grows with every change; the first one is 1
        std::vector<Active> active;
        std::vector<Alarm> cleared;
        Counts counts;
        std::map<AlarmKind, KindCounts> kinds; ///< those that have had an alarm
        AlarmPolicies policies;
        std::optional<Clock::time_point> applied; ///< when the policies were changed last
    };

    AlarmList(AlarmPolicies policies, Report report, std::size_t capacity = kCapacity);

    /// The condition has begun. If it is present already, this counts as another beginning if
    /// `again`, and only renews its description otherwise.
    void begin(Condition const& condition, Instant now, bool again = false);
    /// The condition has ended. No effect if it is absent.
    void end(AlarmKey const& key, Instant now);
    /// Several conditions have begun, several have ended, at the same time.
    void change(std::vector<Condition> const& begun, std::vector<AlarmKey> const& ended,
                Instant now);
    /// Compares the conditions of the kinds of `scope` with those that are `present`, read at
    /// `read`: begins and ends what no event has reported.
    void compare(AlarmScope scope, std::vector<Condition> const& present, Clock::time_point read,
                 Instant now);
    /// Raises and clears what has been held long enough, and what has lost or got a cause. Returns
    /// when to call again at the latest;
    /// nothing when no alarm is held.
    std::optional<Clock::time_point> advance(Instant now);
    /// Takes over another configuration.
    void apply(AlarmPolicies policies, Instant now);
    /// Enters alarms that were active at an earlier end of the agent, before any other operation:
    /// they stay raised, and keep what is known about them, until a comparison shows that their
    /// condition has gone.
    void restore(std::vector<Alarm> const& alarms, Instant now);

    bool isPresent(AlarmKey const& key) const;
    /// The present conditions of a kind.
    std::vector<Condition> present(AlarmKind kind) const;
    /// The alarms that are raised, ascending by key.
    std::vector<Alarm> active() const;
    /// The alarms that were cleared last, the oldest first.
    std::vector<Alarm> cleared() const;
    Counts counts() const;
    /// The version of the contents.
    std::uint64_t version() const;
    /// The contents; only their version if it is `known`.
    Contents contents(std::uint64_t known) const;

  private:
    struct Record {
        Alarm alarm;
        bool present = false;
        bool raised = false;
        bool flapping = false;
        Clock::time_point changed;     ///< when it began or ended last
        Clock::time_point held;        ///< from when its raise hold counts
        std::optional<AlarmKey> cause; ///< what it is a consequence of
        std::array<std::optional<Clock::time_point>, kFlaps>
            beginnings;       ///< the latest ones, as a ring
        std::size_t next = 0; ///< the oldest of `beginnings`
    };
    using Records = std::map<AlarmKey, Record>;

    // All require `m_mutex`.
    /// Returns the record to settle; none if there is nothing to do.
    Records::iterator beginLocked(Condition const& condition, Instant now, bool again);
    void endLocked(Record& record, Instant now);
    /// A condition or alarm has come or gone: the next `advance` looks for its consequences.
    void causeChanged(AlarmKey const& key, Instant now);
    /// What the condition is a consequence of now; null if nothing.
    Record const* causeOf(Condition const& condition) const;
    bool stands(Record const& record) const;
    /// Finds the cause of a condition that is present.
    void explain(Record& record, Instant now);
    void countBeginning(Record& record, Instant now);
    /// Raises or clears, if it is time to. Returns false if the record is of no use any more.
    bool settle(Record& record, Instant now);
    void raise(Record& record, Instant now);
    void clear(Record& record, Instant now);
    /// Counts how long alarms of the kind have been active, and one more or less from now on.
    KindCounts& countActive(AlarmKind kind, bool more, Clock::time_point now);
    std::optional<Clock::time_point> deadline(Record const& record) const;
    void settleAndKeep(Records::iterator at, Instant now);
    /// The same, with a look at its cause.
    void explainAndSettle(Records::iterator at, Instant now);

    Report m_report;
    std::size_t m_capacity;
    mutable std::mutex m_mutex; ///< guards what follows
    AlarmPolicies m_policies;
    std::optional<Clock::time_point> m_applied; ///< when they were changed last
    Records m_records;
    std::deque<Alarm> m_cleared;
    Counts m_counts;
    std::map<AlarmKind, KindCounts> m_kinds;
    std::uint64_t m_version = 1;
    /// Whose conditions may have another cause now; empty: everybody's.
    std::set<std::string> m_changedBoards;
    std::optional<Clock::time_point> m_next; ///< not after the earliest deadline of a record
};

} // namespace kvloamd
