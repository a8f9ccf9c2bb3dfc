// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/LineFaults.h"

#include <algorithm>
#include <set>

#include "agent/rows/FaultRow.h"
#include "board/DS1LineFeature.h"

namespace kvloamd {

namespace {

constexpr std::array<DS1LineStatusEnum, kLineFaults> kStatuses{
    DS1LineStatusLossOfSignal,  DS1LineStatusLossOfFrame,  DS1LineStatusRcvAIS,
    DS1LineStatusRcvFarEndLOF,  DS1LineStatusXmtFarEndLOF, DS1LineStatusXmtAIS,
    DS1LineStatusLoopbackState, DS1LineStatusT16AIS,       DS1LineStatusRcvFarEndLOMF,
    DS1LineStatusXmtFarEndLOMF, DS1LineStatusRcvTestCode,
};

static_assert(kFirstLineFault == kFirstNamedFault &&
                  kFirstLineFault + kLineFaults - 1 == kLastNamedFault,
              "every line fault has a name");

} // namespace

std::optional<std::size_t> lineFault(std::uint16_t value) {
    if (value < kFirstLineFault || value >= kFirstLineFault + kLineFaults) return std::nullopt;
    return value - kFirstLineFault;
}

std::map<std::uint32_t, ShownLineFaults> shownLineFaults(InterfaceRows const& interfaces) {
    std::map<std::uint32_t, ShownLineFaults> boards;
    std::set<std::uint32_t> unknown;
    for (LineRow const& line : interfaces.lines) {
        auto const interface = std::ranges::lower_bound(interfaces.interfaces, line.ifIndex, {},
                                                        &InterfaceRow::ifIndex);
        if (interface == interfaces.interfaces.end() || interface->ifIndex != line.ifIndex)
            continue;
        if (!line.lineStatus) {
            unknown.insert(interface->boardIndex);
            continue;
        }
        ShownLineFaults& shown = boards[interface->boardIndex];
        shown.allClear = shown.allClear && *line.lineStatus == DS1LineStatusNoAlarm;
        for (std::size_t fault = 0; fault < kLineFaults; ++fault)
            if ((*line.lineStatus & kStatuses[fault]) != 0) ++shown.lines[fault];
    }
    for (std::uint32_t const board : unknown)
        boards.erase(board);
    return boards;
}

bool impliesReport(std::size_t lineFault) {
    DS1LineStatusEnum const status = kStatuses[lineFault];
    return status != DS1LineStatusXmtFarEndLOF && status != DS1LineStatusXmtAIS &&
           status != DS1LineStatusXmtFarEndLOMF;
}

} // namespace kvloamd
