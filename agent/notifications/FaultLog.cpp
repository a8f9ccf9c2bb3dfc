// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultLog.h"

#include <algorithm>

#include "agent/readers/Answers.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

namespace {

/// The number of a board whose faults no report has named since the agent's start.
constexpr int kUnknownPlatformBoard = -1;

} // namespace

void FaultLog::raise(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
    std::scoped_lock const guard(m_mutex);
    ++m_raised;
    Key const key = keyOf(boardIndex, platformBoard, value);
    auto const now = Clock::now();
    if (auto const found = m_faults.find(key); found != m_faults.end()) {
        ++found->second.times;
        ++found->second.lines;
        found->second.lastRaised = now;
        found->second.platformBoard = platformBoard;
        return;
    }
    enter(key, platformBoard, 1, now);
}

void FaultLog::clear(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
    std::scoped_lock const guard(m_mutex);
    if (auto const board = m_compared.find(boardIndex);
        board != m_compared.end() && lineFault(value))
        board->second.cleared.insert(value);
    // The fault may have been raised before its board was known.
    for (Key const& key :
         {keyOf(boardIndex, platformBoard, value), keyOf(0, platformBoard, value)}) {
        auto const found = m_faults.find(key);
        if (found == m_faults.end()) continue;
        if (lineFault(value)) {
            Fault& fault = found->second;
            if (fault.lines > 0) --fault.lines;
            if (fault.lines > 0 || isShown(key)) return;
        }
        m_faults.erase(found);
        m_lastChange = Clock::now();
        return;
    }
}

void FaultLog::compare(std::map<std::uint32_t, ShownLineFaults> const& shown,
                       Clock::time_point now) {
    std::scoped_lock const guard(m_mutex);
    m_shown = shown;
    for (auto const& [boardIndex, board] : shown) {
        auto const& compared =
            m_compared.try_emplace(boardIndex, ComparedBoard{now, {}}).first->second;
        if (now - compared.compared >= kLineFaultGrace) continue;
        for (std::size_t fault = 0; fault < kLineFaults; ++fault) {
            auto const value = static_cast<std::uint16_t>(kFirstLineFault + fault);
            Key const key{boardIndex, 0, value};
            if (board.lines[fault] > 0 && impliesReport(fault) && !m_faults.contains(key) &&
                !compared.cleared.contains(value))
                enter(key, kUnknownPlatformBoard, board.lines[fault], now);
        }
    }
    auto const erased = std::erase_if(m_faults, [&](auto const& entry) {
        auto const& [key, fault] = entry;
        auto const board = shown.find(key.boardIndex);
        if (!lineFault(key.value) || board == shown.end() || isShown(key)) return false;
        return fault.lines == 0 ||
               (board->second.allClear && now - fault.lastRaised >= kLineFaultGrace);
    });
    if (erased > 0) m_lastChange = now;
}

bool FaultLog::isShown(Key const& key) const {
    auto const board = m_shown.find(key.boardIndex);
    auto const fault = lineFault(key.value);
    return board != m_shown.end() && fault && board->second.lines[*fault] > 0;
}

void FaultLog::enter(Key const& key, int platformBoard, std::uint32_t lines,
                     Clock::time_point now) {
    if (m_faults.size() >= m_capacity) {
        ++m_unlisted;
        return;
    }
    m_lastChange = now;
    m_faults.emplace(key, Fault{platformBoard, now, std::time(nullptr), 1, lines, now});
}

void FaultLog::boardIsKnown(std::uint32_t boardIndex, int platformBoard) {
    std::scoped_lock const guard(m_mutex);
    auto fault = m_faults.lower_bound({0, platformBoard, 0});
    while (fault != m_faults.end() && fault->first.boardIndex == 0 &&
           fault->first.platformBoard == platformBoard) {
        auto moved = m_faults.extract(fault++);
        moved.key() = keyOf(boardIndex, platformBoard, moved.key().value);
        m_faults.insert(std::move(moved));
        m_lastChange = Clock::now();
    }
}

void FaultLog::boardHasGone(std::uint32_t boardIndex) {
    std::scoped_lock const guard(m_mutex);
    m_shown.erase(boardIndex);
    m_compared.erase(boardIndex);
    auto const gone = std::erase_if(
        m_faults, [&](auto const& entry) { return entry.first.boardIndex == boardIndex; });
    if (gone > 0) m_lastChange = Clock::now();
}

Faults FaultLog::read(Clock::time_point started) const {
    std::scoped_lock const guard(m_mutex);
    Uptime const uptime(started);
    Faults read;
    read.raised = m_raised;
    read.unlisted = m_unlisted;
    if (m_lastChange) read.lastChange = uptime.at(*m_lastChange);
    // One row for each board and value. The faults of unknown boards are sorted by platform board
    // number first, so equal values are not adjacent.
    std::map<std::array<std::uint32_t, 2>, Fault> merged;
    for (auto const& [key, fault] : m_faults) {
        auto const [place, isNew] = merged.try_emplace({key.boardIndex, key.value}, fault);
        if (isNew) continue;
        std::uint32_t const times = place->second.times + fault.times;
        if (fault.when < place->second.when) place->second = fault;
        place->second.times = times;
    }
    read.rows.reserve(merged.size());
    for (auto const& [index, fault] : merged)
        read.rows.push_back({index[0], index[1], fault.platformBoard, uptime.at(fault.when),
                             dateOctets(fault.date), fault.times});
    return read;
}

} // namespace kvloamd
