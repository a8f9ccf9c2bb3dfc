// SPDX-License-Identifier: BSD-2-Clause
// Snapshots of boards with lines and channels, of any size.
#pragma once

#include <memory>
#include <string>

#include "agent/rows/Snapshot.h"
#include "board/Board.h"

namespace kvloamd {

/// How many of each a snapshot has.
struct SampleSize {
    std::uint32_t boards = 2;
    std::uint32_t linesOfABoard = 2;
    std::uint32_t channelsOfALine = 3;
};

inline constexpr std::uint32_t kFirstLine = 1001;

/// Boards NX50001, NX50002 ...; lines nx5-1-trunk-1 ... with `ifIndex` from `kFirstLine`; above the
/// lines a signalling channel, its data link and bearer channels each. The first line of each board
/// has no signal, the first bearer channel of each line is active.
inline std::shared_ptr<Snapshot> sampleBoards(SampleSize const& size = {}) {
    auto snapshot = std::make_shared<Snapshot>();
    InterfaceRows& rows = snapshot->interfaces;
    auto closed = std::make_shared<ClosedIntervals>();
    closed->counts = {LineCounts{1, 2, 3}, LineCounts{}};
    closed->valid = {true, false};
    std::uint32_t ifIndex = kFirstLine - 1;
    auto const enter = [&](std::uint32_t board, std::string const& name, int type) {
        InterfaceRow& row = rows.interfaces.emplace_back();
        row.ifIndex = ++ifIndex;
        row.boardIndex = board;
        row.boardSerialNumber = "NX5000" + std::to_string(board);
        row.name = name;
        row.description = "the interface " + name;
        row.type = type;
        row.speed = 1'544'000;
        row.adminStatus = kUp;
        row.operStatus = kUp;
        row.lastChange = 250;
        return ifIndex;
    };
    for (std::uint32_t board = 1; board <= size.boards; ++board) {
        std::string const number = std::to_string(board);
        BoardRow& row = snapshot->boards.emplace_back();
        row.boardIndex = board;
        row.status = BoardStatusStarted;
        row.serialNumber = "NX5000" + number;
        row.name = "NX5-T1";
        row.model = "NX5-T1";
        row.changeDate = std::string("\x07\xea\x0b\x16\x0d\x0f\x1e\x00+\x01\x00", 11);
        for (std::uint32_t n = 1; n <= size.linesOfABoard; ++n) {
            std::string const name = "nx5-" + number + "-trunk-" + std::to_string(n);
            LineRow line;
            line.ifIndex = enter(board, name, kTypeDs1);
            line.lineType = 2;
            line.lineStatus = n == 1 ? 64 + 8192 : 1;
            line.lineLength = 300;
            line.statusLastChange = 1234;
            line.timeElapsed = 17;
            line.closed = closed;
            line.totals = {10, 9, 8, 7, 6, 500, 4, 3, 2, 1000};
            rows.lines.push_back(line);
        }
    }
    countIntervals(rows);
    if (size.channelsOfALine == 0) return snapshot;
    auto const lines = rows.lines;
    for (LineRow const& line : lines) {
        InterfaceRow const below = rows.interfaces[line.ifIndex - kFirstLine];
        SignallingRow signalling;
        signalling.ifIndex = enter(below.boardIndex, below.name + "-d", kTypeIsdn);
        signalling.inCalls = 5;
        rows.signalling.push_back(signalling);
        LapdRow lapd;
        lapd.ifIndex = enter(below.boardIndex, below.name + "-d-lapd", kTypeLapd);
        lapd.operStatus = 3;
        rows.lapds.push_back(lapd);
        for (std::uint32_t n = 1; n <= size.channelsOfALine; ++n) {
            BearerRow bearer;
            bearer.ifIndex =
                enter(below.boardIndex, below.name + "-b" + std::to_string(n), kTypeDs0);
            bearer.operStatus = n == 1 ? 4 : 1;
            rows.bearers.push_back(bearer);
            rows.ds0Channels.push_back({line.ifIndex, n, bearer.ifIndex});
        }
    }
    return snapshot;
}

} // namespace kvloamd
