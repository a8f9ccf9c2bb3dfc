// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmKinds.h"

#include <algorithm>
#include <array>
#include <stdexcept>

#include "agent/rows/FaultRow.h"

namespace kvloamd {

namespace {

using enum AlarmKind;
using enum AlarmSeverity;
using enum AlarmScope;
using std::chrono::seconds;

/// Signalling channels may report what follows from a failure of their line before the line
/// declares it, and recover after the line.
constexpr seconds kChannelHold{5};
/// A line declares its failure some seconds after the platform has reported the fault. A fault that
/// no line shows stays listed for 30 s, because its end may have been lost.
constexpr seconds kLineFaultHold{40};

// A line's failure has lasted already when its status shows it, and ends 10 s after the defect, as
// the rules for DS1 lines require; its hold times are therefore 0.
constexpr AlarmKindInfo kKinds[] = {
    {BoardFailed, Critical, "boardFailed", seconds(0), seconds(0), Snapshot,
     "the platform reports that the board has failed"},
    {BoardStopped, Major, "boardStopped", seconds(0), seconds(0), Snapshot,
     "the board has stopped although nobody ordered it"},
    {BoardGone, Major, "boardGone", seconds(0), seconds(0), Snapshot,
     "a board that was not stopped before has been removed"},
    {BoardUnreadable, Major, "boardUnreadable", seconds(0), seconds(0), Snapshot,
     "the board does not answer queries"},
    {PlatformFault, Indeterminate, "platformFault", seconds(0), seconds(0), Snapshot,
     "the platform reports a fault of the board"},
    {LineLossOfSignal, Critical, "dsx1LossOfSignal", seconds(0), seconds(0), Snapshot,
     "the line receives no signal"},
    {LineLossOfFrame, Critical, "dsx1LossOfFrame", seconds(0), seconds(0), Snapshot,
     "the line receives a signal without frames"},
    {LineRcvAIS, Major, "dsx1RcvAIS", seconds(0), seconds(0), Snapshot,
     "the line receives the alarm indication signal"},
    {LineRcvFarEndLOF, Minor, "dsx1RcvFarEndLOF", seconds(0), seconds(0), Snapshot,
     "the far end reports that it receives no frames (yellow alarm)"},
    {LineT16AIS, Major, "dsx1T16AIS", seconds(0), seconds(0), Snapshot,
     "the line receives the alarm indication signal in time slot 16"},
    {LineRcvFarEndLOMF, Minor, "dsx1RcvFarEndLOMF", seconds(0), seconds(0), Snapshot,
     "the far end reports that it receives no multiframe"},
    {LineUnavailable, Major, "dsx1UnavailSigState", seconds(0), seconds(0), Snapshot,
     "the line is unavailable: its seconds count as UAS"},
    {LineOtherFailure, Indeterminate, "dsx1OtherFailure", seconds(0), seconds(0), Snapshot,
     "the line has a failure that has no name of its own"},
    {LineNetEquipOOS, Indeterminate, "dsx1NetEquipOOS", seconds(0), seconds(0), Snapshot,
     "the carrier's equipment is out of service"},
    {LineRcvPayloadAIS, Major, "dsx1RcvPayloadAIS", seconds(0), seconds(0), Snapshot,
     "the line receives the alarm indication signal in its payload"},
    {LineDs2PerfThreshold, Warning, "dsx1Ds2PerfThreshold", seconds(0), seconds(0), Snapshot,
     "the DS2 has crossed a performance threshold"},
    {ChannelInactive, Minor, "isdnLapdInactive", kChannelHold, seconds(0), Snapshot,
     "layer 1 of the signalling channel is down"},
    {ChannelLayer2Down, Major, "isdnLapdLayer2Down", kChannelHold, seconds(0), Snapshot,
     "layer 1 of the signalling channel is up, but layer 2 is not established"},
    {LinkDown, Major, "linkDown", seconds(0), seconds(0), Snapshot,
     "the interface is down although nobody switched it off"},
    {SnapshotStale, Major, "agentSnapshotStale", seconds(0), seconds(0), Health,
     "the boards have not been read for 30 seconds: a board or the platform hangs"},
    {PlatformSilent, Critical, "agentPlatformSilent", seconds(0), seconds(0), Snapshot,
     "the platform's device mapper does not list its boards"},
    {StoreUnreadable, Warning, "agentStoreUnreadable", seconds(0), seconds(0), Snapshot,
     "the platform's attribute store cannot be read"},
    {PersistenceFailing, Minor, "agentPersistenceFailing", seconds(0), seconds(0), Health,
     "indices, settings or the journal are not kept across restarts"},
    {NotificationsDropped, Minor, "agentNotificationsDropped", seconds(0), seconds(0), Health,
     "notifications were dropped because too many waited"},
    {MasterLost, Major, "agentMasterLost", seconds(10), seconds(0), Health,
     "there is no connection to the SNMP master"},
    {ThresholdES15m, Warning, "thresholdES15m", seconds(0), seconds(0), Thresholds,
     "the line has counted as many errored seconds in 15 minutes as its limit"},
    {ThresholdES24h, Warning, "thresholdES24h", seconds(0), seconds(0), Thresholds,
     "the line has counted as many errored seconds in 24 hours as its limit"},
    {ThresholdSES15m, Warning, "thresholdSES15m", seconds(0), seconds(0), Thresholds,
     "the line has counted as many severely errored seconds in 15 minutes as its limit"},
    {ThresholdSES24h, Warning, "thresholdSES24h", seconds(0), seconds(0), Thresholds,
     "the line has counted as many severely errored seconds in 24 hours as its limit"},
    {ThresholdUAS15m, Warning, "thresholdUAS15m", seconds(0), seconds(0), Thresholds,
     "the line has counted as many unavailable seconds in 15 minutes as its limit"},
    {ThresholdUAS24h, Warning, "thresholdUAS24h", seconds(0), seconds(0), Thresholds,
     "the line has counted as many unavailable seconds in 24 hours as its limit"},
    {ThresholdCSS15m, Warning, "thresholdCSS15m", seconds(0), seconds(0), Thresholds,
     "the line has counted as many controlled slip seconds in 15 minutes as its limit"},
    {ThresholdCSS24h, Warning, "thresholdCSS24h", seconds(0), seconds(0), Thresholds,
     "the line has counted as many controlled slip seconds in 24 hours as its limit"},
    {ThresholdCV15m, Warning, "thresholdCV15m", seconds(0), seconds(0), Thresholds,
     "the line has counted as many path coding violations in 15 minutes as its limit"},
    {ThresholdCV24h, Warning, "thresholdCV24h", seconds(0), seconds(0), Thresholds,
     "the line has counted as many path coding violations in 24 hours as its limit"},
};

constexpr std::array<char const*, 7> kSeverities{"",      "cleared", "indeterminate", "critical",
                                                 "major", "minor",   "warning"};

} // namespace

std::span<AlarmKindInfo const> alarmKinds() {
    return kKinds;
}

std::chrono::seconds defaultRaiseHold(AlarmKindInfo const& kind, std::uint32_t number) {
    bool const ofLine = kind.kind == PlatformFault && faultKind(number) != kOtherFault;
    return ofLine ? kLineFaultHold : kind.raiseHold;
}

AlarmKindInfo const& alarmKind(AlarmKind kind) {
    auto const* const found = std::ranges::find(kKinds, kind, &AlarmKindInfo::kind);
    if (found == std::end(kKinds)) throw std::invalid_argument("no kind of alarm has this number");
    return *found;
}

AlarmKindInfo const* findAlarmKind(std::string_view name) {
    auto const* const found =
        std::ranges::find_if(kKinds, [&](AlarmKindInfo const& info) { return name == info.name; });
    return found == std::end(kKinds) ? nullptr : found;
}

char const* severityName(AlarmSeverity severity) {
    return kSeverities.at(static_cast<std::size_t>(severity));
}

std::optional<AlarmSeverity> findSeverity(std::string_view name) {
    for (auto const severity : {Indeterminate, Critical, Major, Minor, Warning})
        if (name == severityName(severity)) return severity;
    return std::nullopt;
}

} // namespace kvloamd
