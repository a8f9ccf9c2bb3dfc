// SPDX-License-Identifier: BSD-2-Clause
#include "BoardRefresh.h"

#include <string>

#include "Z7SimBoardFactory.h"
#include "simulator/Control.h"

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
      m_indices("", kvloamd::StableIndices::kDefaultBase),
      m_interfaces(*m_manager.get(), m_indices, kvloamd::Clock::now()) {}

void BoardRefresh::read(kvloamd::Snapshot& snapshot) {
    snapshot.boards = m_source.read();
    snapshot.interfaces = m_interfaces.read(snapshot.boards);
}
