// SPDX-License-Identifier: BSD-2-Clause
#include "BoardRefresh.h"

#include <ctime>
#include <string>

#include "Z7SimBoardFactory.h"
#include "agent/readers/ResourceReader.h"
#include "agent/rows/ResourceRow.h"
#include "platform/ActionScheduler_pthread.h"
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

ReferenceCounter<BoardManager> managerOf(int boards) {
    kvlsim::loadChassis(chassis(boards));
    ReferenceCounter<BoardManager> manager(new BoardManager);
    auto* const factory = new Z7SimBoardFactory;
    factory->SetPingInterval(0);
    manager->Attach(ReferenceCounter<BoardFactory>(factory));
    return manager;
}

} // namespace

BoardRefresh::BoardRefresh(int boards)
    : m_manager(managerOf(boards)),
      m_source(*m_manager.get()),
      m_indices(1000),
      m_interfaces(*m_manager.get(), m_indices, kvloamd::Clock::now()),
      m_entityIndices(1),
      m_entities(m_entityIndices, m_settings, kvloamd::Clock::now(),
                 [] { return std::time(nullptr); }) {}

void BoardRefresh::stopLines() {
    auto* const scheduler = ActionScheduler_pthread::GetScheduler();
    kvloamd::Snapshot snapshot;
    read(snapshot);
    for (kvloamd::PlacedLine const& line : m_interfaces.takeLines())
        scheduler->Remove(line.line.get()->GetIntervalTable().get());
}

void BoardRefresh::read(kvloamd::Snapshot& snapshot) {
    snapshot.boards = m_source.read();
    snapshot.resources = kvloamd::readResources(*m_manager.get(), snapshot.boards);
    snapshot.records = m_platform.read(snapshot.boards);
    snapshot.interfaces = m_interfaces.read(snapshot.boards);
    snapshot.entities = m_entities.read(snapshot);
}
