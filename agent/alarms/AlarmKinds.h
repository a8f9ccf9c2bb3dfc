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
    MasterLost = 55
};

/// Where the present state of a kind's conditions is read from.
enum class AlarmScope {
    Snapshot, ///< boards, lines and channels of the newest snapshot
    Health    ///< the agent itself
};

struct AlarmKindInfo {
    AlarmKind kind;
    char const* name; ///< in the log, the configuration and the tables
    AlarmSeverity severity;
    std::chrono::seconds raiseHold; ///< how long the condition lasts before the alarm is raised
    std::chrono::seconds clearHold; ///< how long it has gone before the alarm is cleared
    AlarmScope scope;
    char const* meaning; ///< one line
};

/// All kinds, ascending by number.
std::span<AlarmKindInfo const> alarmKinds();
AlarmKindInfo const& alarmKind(AlarmKind kind);
/// The kind with this name; null when there is none.
AlarmKindInfo const* findAlarmKind(std::string_view name);

/// "critical", "major" and so on.
char const* severityName(AlarmSeverity severity);
/// The severity with this name; nothing when there is none. "cleared" is none that an alarm has.
std::optional<AlarmSeverity> findSeverity(std::string_view name);

} // namespace kvloamd
