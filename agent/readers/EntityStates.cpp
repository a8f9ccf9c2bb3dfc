// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/EntityStates.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "agent/readers/Answers.h"
#include "agent/rows/RowFinder.h"
#include "board/Board.h"
#include "board/DS1LineDevice.h"

namespace kvloamd {

namespace {

AdminState adminOf(std::optional<int> status) {
    if (status == kUp) return AdminState::Unlocked;
    return status == kDown ? AdminState::Locked : AdminState::Unknown;
}

/// Whether the port itself works. An interface that an operator has taken down, whose board is away
/// or that waits for a lower layer says nothing about that.
OperState operOf(InterfaceRow const& interface) {
    switch (interface.operStatus.value_or(0)) {
    case kUp:
    case kDormant: // it waits for work
        return OperState::Enabled;
    case kDown:
        return interface.adminStatus == kDown ? OperState::Unknown : OperState::Disabled;
    case kTesting:
        return OperState::Testing;
    default:
        return OperState::Unknown;
    }
}

bool has(int lineStatus, unsigned bits) {
    return (static_cast<unsigned>(lineStatus) & bits) != 0;
}

/// What a line sends is the echo of what it receives, and an operator asks for loopbacks
/// and test codes: neither is an alarm.
unsigned alarmsOf(int lineStatus) {
    unsigned alarms = 0;
    if (has(lineStatus, DS1LineStatusLossOfSignal | DS1LineStatusLossOfFrame))
        alarms |= kAlarmCritical;
    if (has(lineStatus, DS1LineStatusRcvAIS | DS1LineStatusT16AIS | DS1LineStatusRcvPayloadAIS |
                            DS1LineStatusUnavailSigState))
        alarms |= kAlarmMajor;
    if (has(lineStatus, DS1LineStatusRcvFarEndLOF | DS1LineStatusRcvFarEndLOMF))
        alarms |= kAlarmMinor;
    if (has(lineStatus, DS1LineStatusDs2PerfThreshold)) alarms |= kAlarmWarning;
    if (has(lineStatus, DS1LineStatusOtherFailure | DS1LineStatusNetEquipOOS))
        alarms |= kAlarmIndeterminate;
    return alarms;
}

} // namespace

EntityState boardState(BoardRow const& board, bool hasFault) {
    // The operational state does not follow the administrative one, and a board that does not run,
    // or not yet, cannot tell whether it could.
    EntityState state;
    // The platform tells no severity.
    unsigned const faults = hasFault ? unsigned{kAlarmIndeterminate} : 0U;
    state.alarm = static_cast<char>(faults);
    if (board.secondaryStatus == BoardStatusFailed) {
        // A failed board is stopped, too, but no operator has locked it.
        state.oper = OperState::Disabled;
        state.alarm = static_cast<char>(faults | kAlarmCritical);
        return state;
    }
    switch (board.status) {
    case BoardStatusStarted:
        state.admin = AdminState::Unlocked;
        state.oper = OperState::Enabled;
        break;
    case BoardStatusStartPending:
        state.admin = AdminState::Unlocked;
        break;
    case BoardStatusStopped:
        state.admin = AdminState::Locked;
        break;
    case BoardStatusStopPending:
        // It works until it has stopped.
        state.admin = AdminState::ShuttingDown;
        state.oper = OperState::Enabled;
        break;
    default:
        break;
    }
    return state;
}

EntityState portState(InterfaceRow const& interface, LineRow const* line) {
    EntityState state;
    state.admin = adminOf(interface.adminStatus);
    state.oper = operOf(interface);
    // A status without any bit, not even the one for no alarm, is no information.
    if (int const status = line == nullptr ? 0 : line->lineStatus.value_or(0); status > 0) {
        unsigned const alarms = alarmsOf(status);
        state.alarm = static_cast<char>(alarms);
        if (state.oper == OperState::Unknown) {
            if ((alarms & (kAlarmCritical | kAlarmMajor)) != 0)
                state.oper = OperState::Disabled;
            else if (status == DS1LineStatusNoAlarm)
                state.oper = OperState::Enabled;
        }
    }
    return state;
}

EntityStates::EntityStates(Now now) : m_now(std::move(now)), m_started(dateOctets(m_now())) {}

Rows<EntityStateRow> EntityStates::read(Rows<PhysicalRow> const& entities,
                                        Rows<BoardRow> const& boards,
                                        InterfaceRows const& interfaces,
                                        std::vector<FaultRow> const& faults) {
    bool const sameFaults = m_read && faults == m_faults;
    if (sameFaults && entities.shares(m_entities) && boards.shares(m_boards) &&
        interfaces.interfaces.shares(m_interfaces) && interfaces.lines.shares(m_lines))
        return m_former;
    std::vector<EntityStateRow> rows;
    rows.reserve(m_former.size());
    std::vector<Origin> origins;
    origins.reserve(entities.size());
    std::string const now = m_read ? dateOctets(m_now()) : m_started;
    RowFinder const boardRows(boards);
    RowFinder const interfaceRows(interfaces.interfaces);
    RowFinder const lineRows(interfaces.lines);
    RowFinder const faultRows(faults);
    RowFinder const formerRows(m_former);
    // The rows of an origin are still there, at the same addresses.
    auto const stands = [&](Origin const& origin) {
        if (origin.board != nullptr) return sameFaults && boardRows.isNext(origin.board);
        return origin.line != nullptr && interfaceRows.isNext(origin.interface) &&
               lineRows.isNext(origin.line);
    };
    bool changed = false;
    auto known = m_origins.cbegin();
    for (PhysicalRow const& entity : entities) {
        while (known != m_origins.cend() && known->entity != &entity &&
               known->entity->entity < entity.entity)
            ++known;
        if (known != m_origins.cend() && known->entity == &entity && stands(*known)) {
            if (known->board != nullptr) {
                boardRows.skip();
            } else {
                interfaceRows.skip();
                lineRows.skip();
            }
            origins.push_back(*known);
            origins.back().state = rows.size();
            rows.push_back(m_former[known->state]);
            ++known;
            continue;
        }
        Origin origin{&entity};
        EntityState state;
        if ((origin.board = boardRows.find(entity.boardIndex)) != nullptr) {
            state = boardState(*origin.board, faultRows.find(entity.boardIndex) != nullptr);
        } else if ((origin.interface = interfaceRows.find(entity.ifIndex)) != nullptr) {
            origin.line = lineRows.find(entity.ifIndex);
            state = portState(*origin.interface, origin.line);
        } else if (entity.physicalClass != PhysicalClass::Cpu) {
            // The platform does not tell how a processor is.
            continue;
        }
        EntityStateRow const* const former = formerRows.find(entity.entity);
        bool const same = former != nullptr && former->state == state;
        changed = changed || !same;
        origin.state = rows.size();
        origins.push_back(origin);
        rows.push_back({entity.entity, state, same ? former->changed : now});
    }
    std::vector<FaultRow> keptFaults = faults;
    m_read = true;
    if (changed || rows.size() != m_former.size()) m_former = std::move(rows);
    m_origins = std::move(origins);
    m_entities = entities;
    m_boards = boards;
    m_interfaces = interfaces.interfaces;
    m_lines = interfaces.lines;
    m_faults = std::move(keptFaults);
    return m_former;
}

} // namespace kvloamd
