// SPDX-License-Identifier: BSD-2-Clause
// The kinds of alarms, and what the agent assumes about each until it is configured otherwise.
#pragma once

#include <chrono>
#include <cstdint>
#include <optional>
#include <span>
#include <string_view>

namespace kvloamd {

/// Perceived severities of ITU-T X.733. The numbers are ItuPerceivedSeverity's.
enum class AlarmSeverity : int {
    Cleared = 1,
    Indeterminate = 2,
    Critical = 3,
    Major = 4,
    Minor = 5,
    Warning = 6
};

/// What can be wrong. The numbers are kept on disk and served: they stay.
enum class AlarmKind : int {
    BoardFailed = 1,
    BoardStopped = 2,
    BoardGone = 3,
    BoardUnreadable = 4,
    PlatformFault = 5,
    LineLossOfSignal = 10,
    LineLossOfFrame = 11,
    LineRcvAIS = 12,
    LineRcvFarEndLOF = 13,
    LineT16AIS = 14,
    LineRcvFarEndLOMF = 15,
    LineUnavailable = 16,
    LineOtherFailure = 17,
    LineNetEquipOOS = 18,
    LineRcvPayloadAIS = 19,
    LineDs2PerfThreshold = 20,
    ChannelInactive = 30,
    ChannelLayer2Down = 31,
    LinkDown = 40,
    SnapshotStale = 50,
    PlatformSilent = 51,
    StoreUnreadable = 52,
    PersistenceFailing = 53,
    NotificationsDropped = 54,
    MasterLost = 55,
    // In the order of `Threshold`.
    ThresholdES15m = 60,
    ThresholdES24h = 61,
    ThresholdSES15m = 62,
    ThresholdSES24h = 63,
    ThresholdUAS15m = 64,
    ThresholdUAS24h = 65,
    ThresholdCSS15m = 66,
    ThresholdCSS24h = 67,
    ThresholdCV15m = 68,
    ThresholdCV24h = 69
};

/// Where the present state of a kind's conditions is read from.
enum class AlarmScope {
    Snapshot,  ///< boards, lines and channels of the newest snapshot
    Health,    ///< the agent itself
    Thresholds ///< the counters of lines
};

struct AlarmKindInfo {
    AlarmKind kind;
    AlarmSeverity severity;
    char const* name;               ///< in the log, the configuration and the tables
    std::chrono::seconds raiseHold; ///< how long the condition lasts before the alarm is raised
    std::chrono::seconds clearHold; ///< how long it has gone before the alarm is cleared
    AlarmScope scope;
    char const* meaning; ///< one line
};

/// All kinds, ascending by number.
std::span<AlarmKindInfo const> alarmKinds();
/// How long the raise hold of an alarm is by default. `number`: of the alarm; the fault value of a
/// platform fault. A fault of a line waits for the line to declare its failure.
std::chrono::seconds defaultRaiseHold(AlarmKindInfo const& kind, std::uint32_t number);
AlarmKindInfo const& alarmKind(AlarmKind kind);
/// The kind with this name; null when there is none.
AlarmKindInfo const* findAlarmKind(std::string_view name);

/// "critical", "major" and so on.
char const* severityName(AlarmSeverity severity);
/// The severity with this name; nothing when there is none. "cleared" is none that an alarm has.
std::optional<AlarmSeverity> findSeverity(std::string_view name);

} // namespace kvloamd
