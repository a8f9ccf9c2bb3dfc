// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/InterfaceReader.h"

#include <algorithm>
#include <array>
#include <iterator>
#include <optional>
#include <set>
#include <utility>

#include "agent/readers/BoardFaults.h"
#include "agent/readers/Courtesy.h"
#include "agent/readers/InterfaceNames.h"
#include "agent/readers/InterfaceStates.h"
#include "agent/readers/LongCounters.h"
#include "board/DS1LineDevice.h"

namespace kvloamd {

namespace {

/// Puts indices in the place of numbers on the board, and sorts the rows by them. Rows without one
/// are left out.
template <class Row>
void placeRows(std::vector<Row>& rows, std::vector<std::uint32_t> const& indices) {
    for (Row& row : rows)
        row.ifIndex = indices[row.ifIndex - 1];
    std::erase_if(rows, [](Row const& row) { return row.ifIndex == 0; });
    // Rows mostly come in order.
    auto const index = [](Row const& row) { return row.index(); };
    if (!std::ranges::is_sorted(rows, {}, index)) std::ranges::sort(rows, {}, index);
}

/// Each interface and what is below it, with nothing above the topmost and below the lowest.
void completeStack(BoardInterfaceRows& rows) {
    std::set<std::uint32_t> higher;
    std::set<std::uint32_t> lower;
    for (StackRow const& row : rows.stack) {
        higher.insert(row.higher);
        lower.insert(row.lower);
    }
    for (InterfaceRow const& row : rows.interfaces) {
        if (!lower.contains(row.ifIndex)) rows.stack.push_back({0, row.ifIndex});
        if (!higher.contains(row.ifIndex)) rows.stack.push_back({row.ifIndex, 0});
    }
    std::ranges::sort(rows.stack);
}

/// Whether the interface has counters, which change without anything else.
bool countsTraffic(InterfaceRow const& row) {
    return std::ranges::any_of(row.counters,
                               [](auto const& counter) { return counter.has_value(); });
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
                                 Clock::time_point started, BoardTurns* turns, Clocks clocks)
    : m_manager(manager),
      m_indices(indices),
      m_turns(turns),
      m_clocks(std::move(clocks)),
      m_uptime(started, m_clocks),
      m_toTicks([this](long seconds) { return m_uptime.of(seconds); }),
      m_changeTimes(started, m_clocks) {}

InterfaceRows InterfaceReader::read(Rows<BoardRow> const& boards) {
    // Also if this reading throws, so that the next one finds what it has left undone.
    bool const anew = std::exchange(m_anew, true);
    ++m_reading;
    m_changes = {};
    m_joined.begin(boards.size(), anew);
    m_histories.begin(m_clocks.now());
    std::vector<BoardKey> const& keys = m_keys.of(boards);
    if (m_keys.areAsBefore()) m_indices.presentAgain();
    auto const dropGone = [this](KnownBoard& known) { drop(known); };
    m_boards.begin();
    for (std::size_t i = 0; i < boards.size(); ++i) {
        readBoard(m_boards.at(boards[i].boardIndex, dropGone), boards[i], keys[i]);
        yieldBetweenBoards();
    }
    m_boards.end(dropGone);
    m_indices.save();
    distinguish(anew);
    join(anew);
    m_read = true;
    m_anew = m_turns == nullptr;
    return m_joined.all();
}

void InterfaceReader::readBoard(KnownBoard& known, BoardRow const& row, BoardKey const& key) {
    bool full = known.rows == nullptr || !known.isShareable || isDue(m_turns, row.boardIndex);
    if (known.rows == nullptr || known.key != key || known.serialNumber != row.serialNumber) {
        full = true;
        known.boardIndex = row.boardIndex;
        known.key = key;
        known.name = key.stable ? key.name : std::to_string(row.boardIndex);
        known.serialNumber = row.serialNumber;
    }
    bool const answers = readGuarded(row.boardIndex, "interfaces", [&] {
        if (full || !readCounts(known))
            readFully(known, row);
        else if (!m_keys.areAsBefore())
            m_indices.indicesOf(key, {});
    });
    if (!answers) drop(known);
}

bool InterfaceReader::readCounts(KnownBoard& known) {
    for (KnownLine const& line : known.lineObjects)
        if (checkLine(*line.line.unlocked()) != line.check) return false;
    LineRows read;
    for (std::size_t i = 0; i < known.lineObjects.size(); ++i) {
        KnownLine const& line = known.lineObjects[i];
        if (line.history.unlocked() == nullptr) continue;
        LineRow const& row = (*known.lines)[i];
        // While a line is unavailable, every reading settles something.
        bool const unavailable = (row.lineStatus.value_or(0) & DS1LineStatusUnavailSigState) != 0;
        if (!unavailable && m_histories.stands(line.history, row)) continue;
        if (read.empty()) read = *known.lines;
        m_histories.read(line.history, read[i]);
        m_lineTotals.add(read[i].ifIndex, read[i]);
    }
    if (read.empty() || read == *known.lines) return true;
    showLines(known, std::move(read));
    return true;
}

void InterfaceReader::readFully(KnownBoard& known, BoardRow const& row) {
    auto const board = m_manager.GetBoardByIndex(static_cast<int>(row.boardIndex));
    Board* const asked = board.get();
    if (asked == nullptr) return drop(known);
    BoardInterfaces found = readInterfaces(*asked, m_toTicks, m_histories);
    for (InterfaceRow& interface : found.rows.interfaces)
        completeName(interface, found.keys[interface.ifIndex - 1], known.name);
    completeStates(found.rows);
    auto const indices = m_indices.indicesOf(known.key, found.keys);
    place(known, std::move(found), indices, row);
}

/// The board is not there, or does not answer: nothing of it is shown.
void InterfaceReader::drop(KnownBoard& known) {
    if (known.lines != nullptr)
        for (LineRow const& line : *known.lines)
            m_lineTotals.rest(line.ifIndex);
    m_joined.exchange(std::move(known.joined), nullptr);
    m_joined.exchange(std::move(known.lines), nullptr);
    if (!known.texts.board.empty()) m_names.remove(std::move(known.texts));
    if (!known.lineObjects.empty()) m_changes.lineObjects.insert(known.boardIndex);
    known = {};
}

void InterfaceReader::place(KnownBoard& known, BoardInterfaces&& found,
                            std::vector<std::uint32_t> const& indices, BoardRow const& row) {
    Clock::time_point const now = m_clocks.now();
    BoardInterfaceRows& rows = found.rows;
    known.isShareable = found.hasOnlyLines && std::ranges::find(indices, 0U) == indices.end() &&
                        std::ranges::none_of(rows.interfaces, countsTraffic);
    std::unordered_map<std::uint32_t, EthernetRow*> ethernets;
    for (EthernetRow& ethernet : rows.ethernets)
        ethernets.emplace(ethernet.ifIndex, &ethernet);
    for (InterfaceRow& interface : rows.interfaces) {
        interface.boardIndex = row.boardIndex;
        interface.boardSerialNumber = row.serialNumber;
        std::uint32_t const index = indices[interface.ifIndex - 1];
        if (index == 0) continue;
        auto const ethernet = ethernets.find(interface.ifIndex);
        auto const [counted, isNew] = known.counted.try_emplace(index);
        countOn(interface, counted->second, isNew,
                ethernet == ethernets.end() ? nullptr : ethernet->second, now);
    }
    std::erase_if(known.counted,
                  [this](auto const& entry) { return entry.second.reading != m_reading; });
    placeLines(known, found, indices, row.boardIndex);
    rows.lines.clear();
    placeRows(rows.interfaces, indices);
    for (BearerRow& bearer : rows.bearers)
        if (bearer.signalling != 0) bearer.signalling = indices[bearer.signalling - 1];
    placeRows(rows.bearers, indices);
    placeRows(rows.signalling, indices);
    placeRows(rows.lapds, indices);
    placeRows(rows.ethernets, indices);
    placeRows(rows.receiveAddresses, indices);
    for (PortRow& port : rows.ports)
        port.boardIndex = row.boardIndex;
    placeRows(rows.ports, indices);
    for (Ds0ChannelRow& channel : rows.ds0Channels)
        channel = {indices[channel.line - 1], channel.timeSlot, indices[channel.channel - 1]};
    std::erase_if(rows.ds0Channels,
                  [](Ds0ChannelRow const& each) { return each.line == 0 || each.channel == 0; });
    std::ranges::stable_sort(rows.ds0Channels, {}, &Ds0ChannelRow::index);
    // Not std::ranges::unique, whose result clang 14 does not compile.
    rows.ds0Channels.erase(std::unique(rows.ds0Channels.begin(), rows.ds0Channels.end(),
                                       [](Ds0ChannelRow const& one, Ds0ChannelRow const& other) {
                                           return one.index() == other.index();
                                       }),
                           rows.ds0Channels.end());
    for (StackRow& each : rows.stack)
        each = {indices[each.higher - 1], indices[each.lower - 1]};
    std::erase_if(rows.stack,
                  [](StackRow const& each) { return each.higher == 0 || each.lower == 0; });
    completeStack(rows);
    placeTables(known, std::move(rows));
}

void InterfaceReader::placeLines(KnownBoard& known, BoardInterfaces& found,
                                 std::vector<std::uint32_t> const& indices,
                                 std::uint32_t boardIndex) {
    Clock::time_point const now = m_clocks.now();
    std::vector<std::pair<std::uint32_t, std::size_t>> order; // ifIndex and place
    for (std::size_t i = 0; i < found.lines.size(); ++i)
        if (auto const index = indices[found.rows.lines[i].ifIndex - 1]; index != 0)
            order.emplace_back(index, i);
    std::ranges::sort(order);
    LineRows rows;
    std::vector<KnownLine> objects;
    for (auto const& [index, i] : order) {
        LineRow& row = rows.emplace_back(std::move(found.rows.lines[i]));
        KnownLine& line = objects.emplace_back(std::move(found.lines[i]));
        row.ifIndex = index;
        m_lineTotals.add(index, row);
        if (line.check.lastChange >= 0)
            row.statusLastChange = m_changeTimes.at(index, line.check.lastChange, now);
    }
    if (known.lines != nullptr)
        for (LineRow const& former : *known.lines)
            if (!std::ranges::binary_search(rows, former.ifIndex, {}, &LineRow::ifIndex))
                m_lineTotals.rest(former.ifIndex);
    auto const isSame = [](KnownLine const& one, KnownLine const& other) {
        return one.line.unlocked() == other.line.unlocked();
    };
    auto const index = &LineRow::ifIndex;
    if (known.lines == nullptr || !std::ranges::equal(objects, known.lineObjects, isSame) ||
        !std::ranges::equal(rows, *known.lines, {}, index, index))
        m_changes.lineObjects.insert(boardIndex);
    // The resources of the board may say the same of its lines.
    if (m_turns != nullptr &&
        !std::ranges::equal(objects, known.lineObjects, {}, &KnownLine::check, &KnownLine::check))
        m_turns->add(boardIndex);
    known.lineObjects = std::move(objects);
    if (known.lines != nullptr && *known.lines == rows) return;
    showLines(known, std::move(rows));
}

void InterfaceReader::showLines(KnownBoard& known, LineRows&& rows) {
    auto shown = std::make_shared<LineRows const>(std::move(rows));
    m_joined.exchange(std::exchange(known.lines, shown), shown);
}

void InterfaceReader::placeTables(KnownBoard& known, BoardInterfaceRows&& placed) {
    BoardTexts texts{known.name, {}};
    texts.interfaces.reserve(placed.interfaces.size());
    for (InterfaceRow const& row : placed.interfaces)
        texts.interfaces.push_back({row.ifIndex, row.name, row.description});
    if (known.rows != nullptr && texts == known.texts) {
        // They were made different from the others' before.
        for (std::size_t i = 0; i < placed.interfaces.size(); ++i) {
            placed.interfaces[i].name = known.rows->interfaces[i].name;
            placed.interfaces[i].description = known.rows->interfaces[i].description;
        }
    } else {
        m_changes.texts.insert(known.boardIndex);
        if (!known.texts.board.empty()) m_names.remove(std::exchange(known.texts, {}));
        m_names.add(texts);
        known.texts = std::move(texts);
    }
    if (known.rows != nullptr && *known.rows == placed) return;
    if (m_turns != nullptr && !placed.interfaces.empty()) m_turns->add(known.boardIndex);
    m_changes.tables.insert(known.boardIndex);
    known.rows = std::make_shared<BoardInterfaceRows const>(std::move(placed));
}

void InterfaceReader::distinguish(bool anew) {
    if (!anew && m_names.update()) {
        for (std::uint32_t const boardIndex : m_changes.texts)
            if (KnownBoard* const known = m_boards.find(boardIndex)) distinguish(*known);
        return;
    }
    std::vector<BoardTexts const*> all;
    for (auto const& [boardIndex, known] : m_boards.all())
        if (known.rows != nullptr) all.push_back(&known.texts);
    m_names.countAnew(all);
    for (auto& [boardIndex, known] : m_boards.all())
        distinguish(known);
}

void InterfaceReader::distinguish(KnownBoard& known) {
    if (known.rows == nullptr) return;
    std::vector<InterfaceTexts> const texts = m_names.distinguish(known.texts);
    auto const isCalled = [](InterfaceRow const& row, InterfaceTexts const& called) {
        return row.name == called.name && row.description == called.description;
    };
    if (std::ranges::equal(known.rows->interfaces, texts, isCalled)) return;
    auto rows = std::make_shared<BoardInterfaceRows>(*known.rows);
    for (std::size_t i = 0; i < texts.size(); ++i) {
        rows->interfaces[i].name = texts[i].name;
        rows->interfaces[i].description = texts[i].description;
    }
    m_changes.tables.insert(known.boardIndex);
    known.rows = std::move(rows);
}

void InterfaceReader::join(bool anew) {
    if (anew)
        for (auto& [boardIndex, known] : m_boards.all())
            known.joined = known.rows;
    for (std::uint32_t const boardIndex : m_changes.tables)
        if (KnownBoard* const known = m_boards.find(boardIndex))
            m_joined.exchange(std::exchange(known->joined, known->rows), known->rows);
    auto const partsOf = [this]<class Part>(std::shared_ptr<Part const> KnownBoard::*part) {
        std::vector<std::shared_ptr<Part const>> parts;
        for (auto const& [boardIndex, known] : m_boards.all())
            if (known.*part != nullptr) parts.push_back(known.*part);
        return parts;
    };
    std::optional<std::uint32_t> now;
    if (m_read) now = m_uptime.at(m_clocks.now());
    m_joined.update([&] { return partsOf(&KnownBoard::rows); },
                    [&] { return partsOf(&KnownBoard::lines); }, now);
    joinLineObjects(anew);
}

void InterfaceReader::joinLineObjects(bool anew) {
    auto const linesOf = [](KnownBoard const& known) {
        std::vector<PlacedLine> lines;
        for (std::size_t i = 0; i < known.lineObjects.size(); ++i)
            lines.push_back(
                {(*known.lines)[i].ifIndex, known.lineObjects[i].line, known.boardIndex});
        return lines;
    };
    auto const insert = [this](auto place, std::vector<PlacedLine>&& lines) {
        m_lines.insert(place, std::make_move_iterator(lines.begin()),
                       std::make_move_iterator(lines.end()));
    };
    if (anew || m_changes.lineObjects.size() > m_boards.all().size() / 8) {
        m_lines.clear();
        for (auto const& [boardIndex, known] : m_boards.all())
            insert(m_lines.end(), linesOf(known));
        return;
    }
    for (std::uint32_t const boardIndex : m_changes.lineObjects) {
        auto const first =
            std::ranges::lower_bound(m_lines, boardIndex, {}, &PlacedLine::boardIndex);
        auto const last =
            std::ranges::upper_bound(m_lines, boardIndex, {}, &PlacedLine::boardIndex);
        auto const place = m_lines.erase(first, last);
        if (KnownBoard const* const known = m_boards.find(boardIndex))
            insert(place, linesOf(*known));
    }
}

void InterfaceReader::countOn(InterfaceRow& row, Counted& counted, bool isNew,
                              EthernetRow* ethernet, Clock::time_point now) {
    std::uint32_t const ticks = m_read ? m_uptime.at(now) : 0;
    if (isNew) {
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

} // namespace kvloamd
