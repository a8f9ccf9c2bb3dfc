// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmCauses.h"

#include <algorithm>
#include <cstddef>
#include <iterator>
#include <utility>
#include <vector>

#include "agent/rows/FaultRow.h"

namespace kvloamd {

namespace {

using enum AlarmKind;

constexpr AlarmKind kBoardFailures[] = {BoardGone, BoardFailed, BoardStopped};

/// Failures that interrupt a line. Each causes those after it: without a signal there is no AIS,
/// and a line that receives AIS has no frame alignment.
constexpr AlarmKind kLineFailures[] = {LineLossOfSignal, LineRcvAIS, LineLossOfFrame};

/// What only a line with frames can tell, or what follows from a failure.
constexpr AlarmKind kOfLines[] = {LineRcvFarEndLOF, LineT16AIS, LineRcvFarEndLOMF,
                                  LineRcvPayloadAIS, LineUnavailable};

constexpr AlarmKind kUnnamedFailures[] = {LineNetEquipOOS, LineOtherFailure};

/// The other failures of a line that its signalling channels do not survive.
constexpr AlarmKind kCutsChannels[] = {LineNetEquipOOS, LineOtherFailure, LineT16AIS,
                                       LineUnavailable, LineRcvFarEndLOF};

/// The alarms of lines whose platform faults are alarms of their own otherwise; their fault values
/// are consecutive. Of a loopback and of what a line sends there is no alarm.
constexpr AlarmKind kByFault[] = {LineLossOfSignal, LineLossOfFrame, LineRcvAIS, LineRcvFarEndLOF};
constexpr std::uint32_t kSendingRai = kFirstNamedFault + 4;
constexpr std::uint32_t kReceivingTimeSlot16Ais = kFirstNamedFault + 7;
constexpr std::uint32_t kReceivingRemoteMultiframeAlarm = kFirstNamedFault + 8;

/// All causes, in order.
class Causes {
  public:
    Causes() {
        addBoards();
        addLines();
        addChannels();
        addFaults();
        add(BoardUnreadable, PlatformSilent, CausedBy::Agent);
        std::ranges::stable_sort(m_all, {}, key);
    }
    std::span<AlarmCause const> of(AlarmKind kind, std::uint32_t fault) const {
        std::pair const sought(kind, fault);
        auto const first = std::ranges::lower_bound(m_all, sought, {}, key);
        auto const last = std::ranges::upper_bound(m_all, sought, {}, key);
        return {m_all.data() + (first - m_all.begin()), static_cast<std::size_t>(last - first)};
    }
    bool isCause(AlarmKind kind) const {
        return std::ranges::find(m_all, kind, &AlarmCause::cause) != m_all.end();
    }

  private:
    static std::pair<AlarmKind, std::uint32_t> key(AlarmCause const& cause) {
        return {cause.consequence, cause.fault};
    }
    void add(AlarmKind consequence, AlarmKind cause, CausedBy where, std::uint32_t fault = 0) {
        m_all.push_back({consequence, cause, where, fault});
    }
    /// Everything on a board, line faults included; its other faults may be why it has failed.
    void addBoards() {
        for (AlarmKind const board : kBoardFailures) {
            for (AlarmKind const kind : kLineFailures)
                add(kind, board, CausedBy::Board);
            for (AlarmKind const kind : kOfLines)
                add(kind, board, CausedBy::Board);
            for (AlarmKind const kind : kUnnamedFailures)
                add(kind, board, CausedBy::Board);
            for (AlarmKind const kind :
                 {LineDs2PerfThreshold, ChannelInactive, ChannelLayer2Down, LinkDown})
                add(kind, board, CausedBy::Board);
            for (std::uint32_t fault = kFirstNamedFault; fault <= kLastNamedFault; ++fault)
                add(PlatformFault, board, CausedBy::Board, fault);
        }
    }
    void addLines() {
        for (auto const* failure = std::begin(kLineFailures); failure != std::end(kLineFailures);
             ++failure) {
            for (auto const* later = std::next(failure); later != std::end(kLineFailures); ++later)
                add(*later, *failure, CausedBy::Interface);
            for (AlarmKind const kind : kOfLines)
                add(kind, *failure, CausedBy::Interface);
        }
        for (AlarmKind const failure : kUnnamedFailures)
            add(LineUnavailable, failure, CausedBy::Interface);
    }
    void addChannels() {
        for (AlarmKind const channel : {ChannelInactive, ChannelLayer2Down}) {
            for (AlarmKind const failure : kLineFailures)
                add(channel, failure, CausedBy::LineBelow);
            for (AlarmKind const failure : kCutsChannels)
                add(channel, failure, CausedBy::LineBelow);
        }
    }
    void addFaults() {
        std::uint32_t fault = kFirstNamedFault;
        for (AlarmKind const kind : kByFault)
            add(PlatformFault, kind, CausedBy::LineOfBoard, fault++);
        for (AlarmKind const kind : kLineFailures)
            add(PlatformFault, kind, CausedBy::LineOfBoard, kSendingRai);
        add(PlatformFault, LineT16AIS, CausedBy::LineOfBoard, kReceivingTimeSlot16Ais);
        add(PlatformFault, LineRcvFarEndLOMF, CausedBy::LineOfBoard,
            kReceivingRemoteMultiframeAlarm);
    }

    std::vector<AlarmCause> m_all;
};

Causes const& causes() {
    static Causes const all;
    return all;
}

} // namespace

std::span<AlarmCause const> causesOf(AlarmKind consequence, std::uint32_t number) {
    return causes().of(consequence, consequence == PlatformFault ? number : 0);
}

bool isCause(AlarmKind kind) {
    return causes().isCause(kind);
}

} // namespace kvloamd
