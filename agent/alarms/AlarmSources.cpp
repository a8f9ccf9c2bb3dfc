// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmSources.h"

#include <algorithm>
#include <map>
#include <set>

#include "board/Board.h"
#include "board/DS1LineDevice.h"
#include "board/ISDNChannel.h"

namespace kvloamd {

namespace {

BoardRow const* findBoard(Snapshot const& snapshot, std::uint32_t boardIndex) {
    auto const found =
        std::ranges::lower_bound(snapshot.boards, boardIndex, {}, &BoardRow::boardIndex);
    return found == snapshot.boards.end() || found->boardIndex != boardIndex ? nullptr : &*found;
}

Condition boardCondition(AlarmKind kind, BoardRow const& row, std::string text = {}) {
    std::string const board = alarmBoard(row.serialNumber, row.boardIndex);
    return {{kind, board, 0}, boardResource(board), row.boardIndex, 0,
            std::move(text),  boardPlace(row)};
}

Condition agentCondition(AlarmKind kind, std::string text = {}) {
    return {{kind, {}, 0}, "agent", 0, 0, std::move(text), {}};
}

/// Collects the conditions of one snapshot.
class Reading {
  public:
    explicit Reading(Snapshot const& snapshot) : m_snapshot(snapshot) {}

    void readBoards() {
        for (BoardRow const& row : m_snapshot.boards) {
            if (row.secondaryStatus == BoardStatusFailed)
                add(boardCondition(AlarmKind::BoardFailed, row, row.errorMessage));
            else if (row.status == BoardStatusNone && !row.errorMessage.empty())
                add(boardCondition(AlarmKind::BoardUnreadable, row, row.errorMessage));
        }
    }
    void keepStopped(std::vector<Condition> const& stopped) {
        std::map<std::string, BoardRow const*> boards;
        for (BoardRow const& row : m_snapshot.boards)
            boards.emplace(alarmBoard(row.serialNumber, row.boardIndex), &row);
        for (Condition const& condition : stopped) {
            auto const found = boards.find(condition.key.board);
            if (found != boards.end() && found->second->status == BoardStatusStopped &&
                found->second->secondaryStatus != BoardStatusFailed)
                add(boardCondition(AlarmKind::BoardStopped, *found->second));
        }
    }
    void keepGone(std::vector<Condition> const& gone) {
        if (gone.empty()) return;
        std::set<std::string> boards;
        std::set<std::string> places;
        for (BoardRow const& row : m_snapshot.boards) {
            boards.insert(alarmBoard(row.serialNumber, row.boardIndex));
            places.insert(boardPlace(row));
        }
        for (Condition condition : gone) {
            bool const replaced = !condition.place.empty() && places.contains(condition.place);
            if (replaced || boards.contains(condition.key.board)) continue;
            condition.boardIndex = 0;
            add(std::move(condition));
        }
    }
    void readFaults() {
        for (FaultRow const& fault : m_snapshot.faults.rows) {
            BoardRow const* const row = findBoard(m_snapshot, fault.boardIndex);
            std::string const board = row == nullptr
                                          ? alarmBoard({}, fault.boardIndex)
                                          : alarmBoard(row->serialNumber, fault.boardIndex);
            add({{AlarmKind::PlatformFault, board, fault.value},
                 boardResource(board),
                 fault.boardIndex,
                 0,
                 "fault " + std::to_string(fault.value),
                 {}});
        }
    }
    void readLines() {
        for (LineRow const& line : m_snapshot.interfaces.lines) {
            auto const status = static_cast<unsigned>(line.lineStatus.value_or(0));
            for (LineAlarm const& alarm : lineAlarms())
                if ((status & alarm.bit) != 0) addOfInterface(alarm.kind, line.ifIndex);
        }
    }
    void readChannels() {
        for (LapdRow const& channel : m_snapshot.interfaces.lapds) {
            if (channel.operStatus == ISDNDChannelStatusInactive)
                addOfInterface(AlarmKind::ChannelInactive, channel.ifIndex, lineBelow(channel));
            else if (channel.operStatus == ISDNDChannelStatusL1Active)
                addOfInterface(AlarmKind::ChannelLayer2Down, channel.ifIndex, lineBelow(channel));
        }
    }
    /// Of lines and channels, their own alarms say what is wrong.
    void readLinks() {
        for (EthernetRow const& link : m_snapshot.interfaces.ethernets) {
            InterfaceRow const* const row = interface(link.ifIndex);
            if (row != nullptr && row->operStatus == kDown && row->adminStatus != kDown)
                addOfInterface(AlarmKind::LinkDown, link.ifIndex);
        }
    }
    void readPlatform() {
        if (m_snapshot.platformSilent) add(agentCondition(AlarmKind::PlatformSilent));
        if (m_snapshot.storeUnreadable) add(agentCondition(AlarmKind::StoreUnreadable));
    }

    std::vector<Condition> take() { return std::move(m_conditions); }

  private:
    void add(Condition condition) { m_conditions.push_back(std::move(condition)); }
    InterfaceRow const* interface(std::uint32_t ifIndex) const {
        auto const& all = m_snapshot.interfaces.interfaces;
        auto const found = std::ranges::lower_bound(all, ifIndex, {}, &InterfaceRow::ifIndex);
        return found == all.end() || found->ifIndex != ifIndex ? nullptr : &*found;
    }
    void addOfInterface(AlarmKind kind, std::uint32_t ifIndex, std::uint32_t line = 0) {
        InterfaceRow const* const row = interface(ifIndex);
        if (row == nullptr) return;
        add(interfaceCondition(kind, *row, findBoard(m_snapshot, row->boardIndex)));
        m_conditions.back().line = line;
    }
    /// What the channel stands on; 0 if that is not known.
    std::uint32_t lineBelow(LapdRow const& channel) const {
        auto const& stack = m_snapshot.interfaces.stack;
        auto const found = std::ranges::lower_bound(stack, StackRow{channel.ifIndex, 1});
        return found == stack.end() || found->higher != channel.ifIndex ? 0 : found->lower;
    }

    Snapshot const& m_snapshot;
    std::vector<Condition> m_conditions;
};

} // namespace

std::string alarmBoard(std::string const& serialNumber, std::uint32_t boardIndex) {
    if (!serialNumber.empty() || boardIndex == 0) return serialNumber;
    return "#" + std::to_string(boardIndex);
}

std::string boardResource(std::string const& board) {
    return board.empty() ? "unknown board" : "board " + board;
}

std::string boardPlace(BoardRow const& board) {
    if (!board.pciSlotNumber) return {};
    std::string place;
    if (board.shelfId) place += "shelf " + std::to_string(*board.shelfId) + ", ";
    if (board.busNumber) place += "bus " + std::to_string(*board.busNumber) + ", ";
    return place + "slot " + std::to_string(*board.pciSlotNumber);
}

Condition interfaceCondition(AlarmKind kind, InterfaceRow const& row, BoardRow const* board) {
    std::string const name =
        alarmBoard(board == nullptr ? std::string() : board->serialNumber, row.boardIndex);
    return {{kind, name, row.ifIndex},
            boardResource(name) + ", " + row.description,
            row.boardIndex,
            row.ifIndex,
            {},
            {}};
}

std::vector<LineAlarm> const& lineAlarms() {
    static std::vector<LineAlarm> const all{
        {DS1LineStatusLossOfSignal, AlarmKind::LineLossOfSignal},
        {DS1LineStatusLossOfFrame, AlarmKind::LineLossOfFrame},
        {DS1LineStatusRcvAIS, AlarmKind::LineRcvAIS},
        {DS1LineStatusRcvFarEndLOF, AlarmKind::LineRcvFarEndLOF},
        {DS1LineStatusT16AIS, AlarmKind::LineT16AIS},
        {DS1LineStatusRcvFarEndLOMF, AlarmKind::LineRcvFarEndLOMF},
        {DS1LineStatusUnavailSigState, AlarmKind::LineUnavailable},
        {DS1LineStatusOtherFailure, AlarmKind::LineOtherFailure},
        {DS1LineStatusNetEquipOOS, AlarmKind::LineNetEquipOOS},
        {DS1LineStatusRcvPayloadAIS, AlarmKind::LineRcvPayloadAIS},
        {DS1LineStatusDs2PerfThreshold, AlarmKind::LineDs2PerfThreshold},
    };
    return all;
}

std::vector<Condition> conditionsIn(Snapshot const& snapshot, std::vector<Condition> const& stopped,
                                    std::vector<Condition> const& gone) {
    Reading reading(snapshot);
    reading.readBoards();
    reading.keepStopped(stopped);
    reading.keepGone(gone);
    reading.readFaults();
    reading.readLines();
    reading.readChannels();
    reading.readLinks();
    reading.readPlatform();
    return reading.take();
}

std::vector<Condition> HealthWatch::conditions(Snapshot const& newest, Clock::time_point now,
                                               bool journalFails) {
    std::vector<Condition> conditions;
    if (now - newest.begun >= kStale)
        conditions.push_back(agentCondition(AlarmKind::SnapshotStale));
    if (newest.persistence != Persistence::Kept)
        conditions.push_back(agentCondition(AlarmKind::PersistenceFailing,
                                            newest.persistence == Persistence::InUse
                                                ? "another process has locked a file"
                                                : "a file cannot be read or written"));
    else if (journalFails)
        conditions.push_back(
            agentCondition(AlarmKind::PersistenceFailing, "the journal cannot be written"));
    if (std::uint32_t const dropped = m_counters.notificationsDropped; dropped != m_dropped) {
        m_dropped = dropped;
        m_lastDropped = now;
    }
    if (m_lastDropped && now - *m_lastDropped < kDropped)
        conditions.push_back(agentCondition(AlarmKind::NotificationsDropped,
                                            std::to_string(m_dropped) + " since the start"));
    if (m_counters.master == Master::Lost)
        conditions.push_back(agentCondition(AlarmKind::MasterLost));
    return conditions;
}

} // namespace kvloamd
