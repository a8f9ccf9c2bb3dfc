// SPDX-License-Identifier: BSD-2-Clause
#include "BoardRefresh.h"

#include <atomic>
#include <chrono>
#include <cstdint>
#include <ctime>
#include <stdexcept>
#include <string>

#include "DrivenLineScheduler.h"
#include "Z7SimBoardFactory.h"
#include "agent/readers/Whereabouts.h"
#include "simulator/exports/Control.h"

namespace {

constexpr int kLinesOfABoard = 4;

std::string chassis(int boards) {
    std::string text = "boards:\n";
    int handle = boards;
    for (int board = 1; board <= boards; ++board) {
        std::string const number = std::to_string(board);
        text += "  - handle: " + number + "\n    attributes: {SERIAL_NUMBER: S" + number +
                ", NAME: BENCH}\n    devices:\n";
        for (int line = 1; line <= kLinesOfABoard; ++line) {
            text +=
                "      - {handle: " + std::to_string(++handle) +
                ", type: 501, attributes: {NAME: b" + number + "-line-" + std::to_string(line) +
                "}, line: {type: esf, past: {seconds: 86000, errors: {code-violations: 0.01}}}}\n";
        }
    }
    return text;
}

/// The seconds of the lines.
std::atomic<long> s_seconds{100'000};

ReferenceCounter<BoardManager> managerOf(int boards) {
    DrivenLineScheduler::install();
    kvlsim::setLineClock([] { return std::chrono::nanoseconds(std::chrono::seconds(s_seconds)); });
    kvlsim::loadChassis(chassis(boards));
    ReferenceCounter<BoardManager> manager(new BoardManager);
    auto* const factory = new Z7SimBoardFactory;
    factory->SetPingInterval(0);
    manager->Attach(ReferenceCounter<BoardFactory>(factory));
    return manager;
}

void command(nlohmann::json const& command) {
    if (!kvlsim::execute(command).value("ok", false))
        throw std::runtime_error("the platform refuses " + command.dump());
}

} // namespace

BoardRefresh::BoardRefresh(int boards)
    : m_boards(boards),
      m_manager(managerOf(boards)),
      m_source(*m_manager.get(), &m_turns),
      m_indices(1000),
      m_interfaces(*m_manager.get(), m_indices, kvloamd::Clock::now(), &m_turns),
      m_resources(*m_manager.get(), &m_turns),
      m_entityIndices(1),
      m_entities(m_entityIndices, m_settings, kvloamd::Clock::now(),
                 [] { return std::time(nullptr); }) {
    m_manager->AddBoardStatusListener(this);
}

int BoardRefresh::ProcessBoardStatusEvent(ReferenceCounter<BoardStatusEvent> event) {
    m_turns.note(static_cast<std::uint32_t>(m_manager->GetIndexByBoard(event->GetBoard())));
    return 0;
}

void BoardRefresh::let(Happened happened) {
    switch (happened) {
    case Happened::Nothing:
        break;
    case Happened::Counting:
        ++s_seconds;
        DrivenLineScheduler::install().pass(s_seconds);
        break;
    case Happened::StatusOf1:
        command({{"command", m_changes % 2 == 0 ? "stop" : "start"},
                 {"board", 1 + m_changes / 2 % m_boards}});
        command({{"command", "drain"}});
        ++m_changes;
        break;
    case Happened::Everything:
        for (int board = 1; board <= m_boards; ++board)
            m_turns.note(static_cast<std::uint32_t>(board));
        break;
    }
}

void BoardRefresh::read(kvloamd::Snapshot& snapshot) {
    snapshot.boards = m_source.read();
    snapshot.records = m_platform.read(snapshot.boards);
    snapshot.interfaces = m_interfaces.read(snapshot.boards);
    snapshot.resources = m_resources.read(snapshot.boards);
    snapshot.entities = m_entities.read(snapshot);
    kvloamd::noteWhereabouts(snapshot);
}
