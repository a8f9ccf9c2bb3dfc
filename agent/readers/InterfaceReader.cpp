// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceReader.h"

#include <algorithm>
#include <array>
#include <functional>
#include <iterator>
#include <set>
#include <utility>

#include "agent/readers/BoardFaults.h"
#include "agent/readers/BoardKeys.h"
#include "agent/readers/Courtesy.h"
#include "agent/readers/InterfaceNames.h"
#include "agent/readers/InterfaceStates.h"
#include "agent/readers/LongCounters.h"

namespace kvloamd {

namespace {

/// Moves rows over, with their numbers on the board made indices; rows without one are left out.
template <class Row>
void moveRows(std::vector<Row>& all, std::vector<Row>& rows,
              std::vector<std::uint32_t> const& indices) {
    for (Row& row : rows) {
        row.ifIndex = indices[row.ifIndex - 1];
        if (row.ifIndex != 0) all.push_back(std::move(row));
    }
}

/// Rows mostly come in order: boards do, and so do the indices that they were given.
template <class Row, class Index = std::identity>
void sortBy(std::vector<Row>& rows, Index index = {}) {
    if (!std::ranges::is_sorted(rows, {}, index)) std::ranges::sort(rows, {}, index);
}

/// Each interface and what is below it, with nothing above the topmost and below the lowest.
void completeStack(InterfaceRows& all) {
    std::set<std::uint32_t> higher;
    std::set<std::uint32_t> lower;
    for (StackRow const& row : all.stack) {
        higher.insert(row.higher);
        lower.insert(row.lower);
    }
    for (InterfaceRow const& row : all.interfaces)
        if (!lower.contains(row.ifIndex)) all.stack.push_back({0, row.ifIndex});
    for (InterfaceRow const& row : all.interfaces)
        if (!higher.contains(row.ifIndex)) all.stack.push_back({row.ifIndex, 0});
    sortBy(all.stack);
}

/// What to call each board in the names of its interfaces, by its index.
std::unordered_map<std::uint32_t, std::string> boardNames(std::vector<BoardRow> const& boards,
                                                          std::vector<BoardKey> const& keys) {
    std::unordered_map<std::uint32_t, std::string> names;
    for (std::size_t i = 0; i < boards.size(); ++i) {
        std::uint32_t const index = boards[i].boardIndex;
        names.emplace(index, keys[i].stable ? keys[i].name : std::to_string(index));
    }
    return names;
}

/// How long after an interface has changed this may become certain, in hundredths of a second.
constexpr std::uint32_t kLongestDoubt = 6000;

/// Of every counter of an interface.
std::array<std::uint64_t, kInterfaceCounters> interfaceLimits(CountLimits const& limits) {
    std::array<std::uint64_t, kInterfaceCounters> all{};
    all.fill(limits.others);
    all[kInOctets] = all[kOutOctets] = limits.octets;
    return all;
}

} // namespace

InterfaceReader::InterfaceReader(BoardManager& manager, StableIndices& indices,
                                 Clock::time_point started)
    : m_manager(manager), m_indices(indices), m_uptime(started), m_changeTimes(started) {}

InterfaceRows InterfaceReader::read(std::vector<BoardRow> const& boards) {
    InterfaceRows all;
    // Hardly ever do interfaces come or go.
    all.interfaces.reserve(m_formerIndices.size());
    all.lines.reserve(m_formerLines);
    all.stack.reserve(m_formerStack.size());
    m_lines.clear();
    ++m_reading;
    m_histories.begin(Clock::now());
    m_lineTotals.begin();
    ToTicks const toTicks = [this](long seconds) { return m_uptime.of(seconds); };
    std::vector<BoardKey> const keys = boardKeys(boards);
    auto const names = boardNames(boards, keys);
    for (std::size_t i = 0; i < boards.size(); ++i) {
        std::uint32_t const boardIndex = boards[i].boardIndex;
        auto const board = m_manager.GetBoardByIndex(static_cast<int>(boardIndex));
        Board* const asked = board.get();
        if (asked == nullptr) continue;
        readGuarded(boardIndex, "interfaces", [&] {
            BoardInterfaces found = readInterfaces(*asked, toTicks, m_histories);
            for (InterfaceRow& row : found.rows.interfaces)
                completeName(row, found.keys[row.ifIndex - 1], names.at(boardIndex));
            completeStates(found.rows);
            auto const indices = m_indices.indicesOf(keys[i], found.keys);
            append(all, std::move(found), indices, boardIndex);
        });
        yieldBetweenBoards();
    }
    m_indices.save();
    m_lineTotals.end();
    if (m_counted.size() > all.interfaces.size())
        std::erase_if(m_counted,
                      [this](auto const& entry) { return entry.second.reading != m_reading; });
    sortBy(all.interfaces, &InterfaceRow::ifIndex);
    sortBy(all.lines, &LineRow::ifIndex);
    sortBy(all.bearers, &BearerRow::ifIndex);
    sortBy(all.ds0Channels, &Ds0ChannelRow::index);
    // Not std::ranges::unique, whose result clang 14 does not compile.
    auto const twice = std::unique(all.ds0Channels.begin(), all.ds0Channels.end(),
                                   [](Ds0ChannelRow const& one, Ds0ChannelRow const& other) {
                                       return one.index() == other.index();
                                   });
    all.ds0Channels.erase(twice, all.ds0Channels.end());
    sortBy(all.signalling, &SignallingRow::ifIndex);
    sortBy(all.lapds, &LapdRow::ifIndex);
    sortBy(all.ethernets, &EthernetRow::ifIndex);
    sortBy(all.receiveAddresses, [](auto const& row) { return row.index(); });
    sortBy(all.ports, &PortRow::ifIndex);
    distinguishNames(all.interfaces, names);
    completeStack(all);
    std::size_t before = 0;
    for (LineRow& line : all.lines) {
        line.intervalsBefore = before;
        before += line.closedIntervals();
    }
    noteChanges(all);
    m_read = true;
    return all;
}

void InterfaceReader::append(InterfaceRows& all, BoardInterfaces&& board,
                             std::vector<std::uint32_t> const& indices, std::uint32_t boardIndex) {
    Clock::time_point const now = Clock::now();
    std::unordered_map<std::uint32_t, EthernetRow*> ethernets;
    for (EthernetRow& row : board.rows.ethernets)
        ethernets.emplace(row.ifIndex, &row);
    for (InterfaceRow& row : board.rows.interfaces) {
        auto const ethernet = ethernets.find(row.ifIndex);
        std::uint32_t const index = indices[row.ifIndex - 1];
        row.boardIndex = boardIndex;
        if (index != 0)
            countOn(row, index, ethernet == ethernets.end() ? nullptr : ethernet->second, now);
    }
    moveRows(all.interfaces, board.rows.interfaces, indices);
    for (std::size_t i = 0; i < board.lines.size(); ++i) {
        auto const index = indices[board.rows.lines[i].ifIndex - 1];
        if (index == 0) continue;
        m_lineTotals.add(index, board.rows.lines[i]);
        if (auto const date = board.lineChanges[i])
            board.rows.lines[i].statusLastChange = m_changeTimes.at(index, *date, now);
        m_lines.push_back({index, std::move(board.lines[i]), boardIndex});
    }
    moveRows(all.lines, board.rows.lines, indices);
    for (BearerRow& row : board.rows.bearers)
        if (row.signalling != 0) row.signalling = indices[row.signalling - 1];
    moveRows(all.bearers, board.rows.bearers, indices);
    moveRows(all.signalling, board.rows.signalling, indices);
    moveRows(all.lapds, board.rows.lapds, indices);
    moveRows(all.ethernets, board.rows.ethernets, indices);
    moveRows(all.receiveAddresses, board.rows.receiveAddresses, indices);
    for (PortRow& port : board.rows.ports)
        port.boardIndex = boardIndex;
    moveRows(all.ports, board.rows.ports, indices);
    for (Ds0ChannelRow const& row : board.rows.ds0Channels) {
        Ds0ChannelRow const placed{indices[row.line - 1], row.timeSlot, indices[row.channel - 1]};
        if (placed.line != 0 && placed.channel != 0) all.ds0Channels.push_back(placed);
    }
    for (StackRow const& row : board.rows.stack) {
        StackRow const placed{indices[row.higher - 1], indices[row.lower - 1]};
        if (placed.higher != 0 && placed.lower != 0) all.stack.push_back(placed);
    }
}

void InterfaceReader::countOn(InterfaceRow& row, std::uint32_t ifIndex, EthernetRow* ethernet,
                              Clock::time_point now) {
    auto const [place, isNew] = m_counted.try_emplace(ifIndex);
    Counted& counted = place->second;
    std::uint32_t const ticks = m_read ? m_uptime.at(now) : 0;
    if (isNew || counted.boardIndex != row.boardIndex) {
        counted = {};
        counted.boardIndex = row.boardIndex;
        counted.since = ticks;
        counted.operStatus = row.operStatus;
        counted.lastChange = row.lastChange.value_or(ticks);
    }
    noteOperStatus(row, counted, now);
    CountLimits const limits = countLimits(row.speed, now - counted.readAt);
    auto const limitsOfRow = interfaceLimits(limits);
    std::array<std::uint64_t, kEthernetCounters> limitsOfEthernet{};
    limitsOfEthernet.fill(limits.others);
    if (hasRestarted(counted.counters, row.counters, limitsOfRow) ||
        (ethernet != nullptr &&
         hasRestarted(counted.ethernet, ethernet->counters, limitsOfEthernet))) {
        // Whatever began one of them again has probably begun all of them again.
        counted.counters = {};
        counted.ethernet = {};
        counted.since = ticks;
    }
    kvloamd::countOn(counted.counters, row.counters);
    if (ethernet != nullptr) kvloamd::countOn(counted.ethernet, ethernet->counters);
    counted.reading = m_reading;
    counted.readAt = now;
    row.discontinuity = counted.since;
}

void InterfaceReader::noteOperStatus(InterfaceRow& row, Counted& counted,
                                     Clock::time_point now) const {
    if (counted.operStatus != row.operStatus) {
        counted.operStatus = row.operStatus;
        std::uint32_t const seen = m_uptime.at(now);
        // That a line is unavailable, or available again, is certain some seconds later only.
        bool const isSaid = row.lastChange && *row.lastChange > counted.lastChange &&
                            *row.lastChange <= seen && seen - *row.lastChange <= kLongestDoubt;
        counted.lastChange = isSaid ? *row.lastChange : seen;
    }
    row.lastChange = counted.lastChange;
}

void InterfaceReader::noteChanges(InterfaceRows& all) {
    std::vector<std::uint32_t> indices;
    indices.reserve(all.interfaces.size());
    for (InterfaceRow const& row : all.interfaces)
        indices.push_back(row.ifIndex);
    if (m_read && indices != m_formerIndices) m_lastChange = m_uptime.now();
    if (m_read && all.stack != m_formerStack) m_stackLastChange = m_uptime.now();
    m_formerIndices = std::move(indices);
    m_formerStack = all.stack;
    m_formerLines = all.lines.size();
    all.lastChange = m_lastChange;
    all.stackLastChange = m_stackLastChange;
}

} // namespace kvloamd
