// SPDX-License-Identifier: BSD-2-Clause
#include "agent/alarms/AlarmEvents.h"

#include <algorithm>
#include <optional>
#include <utility>

#include "agent/alarms/AlarmSources.h"
#include "agent/log/Log.h"
#include "agent/readers/BoardReader.h"
#include "z7/Z7Board.h"

namespace kvloamd {

namespace {

/// Whether a stop that is being reported was ordered. A platform that does not announce stops
/// cannot tell.
bool stopWasOrdered(Board& board) {
    auto* const z7 = dynamic_cast<Z7Board*>(&board);
    return z7 == nullptr || z7->GetLastCondition() == BoardStatusStopPending;
}

char const* statusName(BoardStatusEnum status) {
    switch (status) {
    case BoardStatusStarted:
        return "started";
    case BoardStatusStopped:
        return "stopped";
    case BoardStatusAdded:
        return "added";
    case BoardStatusRemoved:
        return "removed";
    case BoardStatusFailed:
        return "failed";
    default:
        return "unknown status";
    }
}

std::uint32_t unsignedIndex(int index) {
    return static_cast<std::uint32_t>(std::max(index, 0));
}

} // namespace

void AlarmEvents::boardStatus(int boardIndex, Board& board, BoardStatusEnum status) {
    std::uint32_t const index = unsignedIndex(boardIndex);
    std::string const name = alarmBoard(readSerialNumber(board), index);
    Condition condition{{AlarmKind::BoardFailed, name, 0}, boardResource(name), index, 0, {}, {}};
    auto const of = [&](AlarmKind kind) {
        condition.key.kind = kind;
        return condition;
    };
    bool const ordered = status != BoardStatusStopped || stopWasOrdered(board);
    std::string const text = condition.resource + ": " + statusName(status) +
                             (ordered ? "" : ", although nobody ordered it");
    if (m_note) m_note(text, name);
    log(status == BoardStatusFailed ? LogLevel::Warning : LogLevel::Info, text,
        {{"KVL_BOARD", name}, {"KVL_BOARD_STATUS", statusName(status)}});
    Instant const now = m_now();
    if (status == BoardStatusStopped || status == BoardStatusStarted || status == BoardStatusFailed)
        noteStop(index, status == BoardStatusStopped && ordered);
    std::vector<Condition> begun;
    std::vector<AlarmKey> ended;
    auto const end = [&](AlarmKind kind) { ended.push_back(of(kind).key); };
    switch (status) {
    case BoardStatusFailed:
        begun.push_back(of(AlarmKind::BoardFailed));
        end(AlarmKind::BoardStopped);
        break;
    case BoardStatusStopped:
        if (!ordered) begun.push_back(of(AlarmKind::BoardStopped));
        break;
    case BoardStatusRemoved:
        end(AlarmKind::BoardFailed);
        end(AlarmKind::BoardStopped);
        if (KnownBoard const last = known(index); !last.stoppedInOrder) {
            Condition gone = of(AlarmKind::BoardGone);
            gone.place = last.place;
            begun.push_back(std::move(gone));
        }
        break;
    case BoardStatusStarted:
        end(AlarmKind::BoardFailed);
        end(AlarmKind::BoardStopped);
        [[fallthrough]];
    case BoardStatusAdded:
        end(AlarmKind::BoardGone);
        break;
    default:
        break;
    }
    m_list.change(begun, ended, now);
}

void AlarmEvents::fault(bool raised, int boardIndex, std::string const& serialNumber,
                        std::uint16_t value) {
    std::string const board = alarmBoard(serialNumber, unsignedIndex(boardIndex));
    std::string const text = "fault " + std::to_string(value);
    log(raised ? LogLevel::Warning : LogLevel::Info,
        boardResource(board) + ": " + text + (raised ? " raised" : " cleared"),
        {{"KVL_BOARD", board}, {"KVL_FAULT", std::to_string(value)}});
    // Its end is left to the next snapshot: another line may still have it.
    if (raised)
        m_list.begin({{AlarmKind::PlatformFault, board, value},
                      boardResource(board),
                      unsignedIndex(boardIndex),
                      0,
                      text,
                      {}},
                     m_now(), true);
}

void AlarmEvents::lineStatus(std::uint32_t ifIndex, int status) {
    std::optional<Line> line;
    {
        std::scoped_lock const guard(m_mutex);
        auto const found = m_lines.find(ifIndex);
        if (found == m_lines.end()) return;
        line = found->second;
        found->second.status = status;
    }
    Instant const now = m_now();
    unsigned alarmBits = 0;
    std::vector<Condition> begun;
    std::vector<AlarmKey> ended;
    for (LineAlarm const& alarm : lineAlarms()) {
        alarmBits |= alarm.bit;
        line->condition.key.kind = alarm.kind;
        if ((static_cast<unsigned>(status) & alarm.bit) != 0)
            begun.push_back(line->condition);
        else
            ended.push_back(line->condition.key);
    }
    m_list.change(begun, ended, now);
    // Alarms are logged by the list. Loopbacks, test codes and what the line sends are not.
    unsigned const others = ~(alarmBits | 1U);
    if (((static_cast<unsigned>(status) ^ static_cast<unsigned>(line->status)) & others) != 0)
        log(LogLevel::Info, line->condition.resource + ": line status " + std::to_string(status),
            {{"KVL_BOARD", line->condition.key.board}, {"KVL_LINE", std::to_string(ifIndex)}});
}

void AlarmEvents::update(Snapshot const& snapshot) {
    rememberLines(snapshot);
    rememberBoards(snapshot);
    m_list.compare(AlarmScope::Snapshot,
                   conditionsIn(snapshot, m_list.present(AlarmKind::BoardStopped),
                                m_list.present(AlarmKind::BoardGone)),
                   snapshot.begun, m_now());
}

void AlarmEvents::rememberLines(Snapshot const& snapshot) {
    std::map<std::uint32_t, Line> lines;
    std::map<std::uint32_t, BoardRow const*> boards;
    for (BoardRow const& board : snapshot.boards)
        boards.emplace(board.boardIndex, &board);
    auto interface = snapshot.interfaces.interfaces.begin();
    for (LineRow const& line : snapshot.interfaces.lines) {
        while (interface != snapshot.interfaces.interfaces.end() &&
               interface->ifIndex < line.ifIndex)
            ++interface;
        if (interface == snapshot.interfaces.interfaces.end()) break;
        if (interface->ifIndex != line.ifIndex) continue;
        auto const board = boards.find(interface->boardIndex);
        lines.emplace_hint(lines.end(), line.ifIndex,
                           Line{interfaceCondition(AlarmKind::LineLossOfSignal, *interface,
                                                   board == boards.end() ? nullptr : board->second),
                                line.lineStatus.value_or(0)});
    }
    std::scoped_lock const guard(m_mutex);
    m_lines.swap(lines);
}

void AlarmEvents::rememberBoards(Snapshot const& snapshot) {
    std::scoped_lock const guard(m_mutex);
    std::map<std::uint32_t, KnownBoard> boards;
    for (BoardRow const& row : snapshot.boards) {
        auto const former = m_boards.find(row.boardIndex);
        bool const stopped =
            former != m_boards.end()
                ? former->second.stoppedInOrder
                : row.status == BoardStatusStopped && row.secondaryStatus != BoardStatusFailed;
        boards.emplace_hint(boards.end(), row.boardIndex, KnownBoard{boardPlace(row), stopped});
    }
    m_boards.swap(boards);
}

void AlarmEvents::noteStop(std::uint32_t boardIndex, bool inOrder) {
    std::scoped_lock const guard(m_mutex);
    m_boards[boardIndex].stoppedInOrder = inOrder;
}

AlarmEvents::KnownBoard AlarmEvents::known(std::uint32_t boardIndex) {
    std::scoped_lock const guard(m_mutex);
    auto const found = m_boards.find(boardIndex);
    return found == m_boards.end() ? KnownBoard{} : found->second;
}

} // namespace kvloamd
