// SPDX-License-Identifier: BSD-2-Clause
#include "agent/notifications/FaultLog.h"

#include <algorithm>

#include "agent/readers/Answers.h"
#include "agent/rows/Uptime.h"

namespace kvloamd {

void FaultLog::raise(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
    std::scoped_lock const guard(m_mutex);
    ++m_raised;
    Key const key = keyOf(boardIndex, platformBoard, value);
    if (auto const found = m_faults.find(key); found != m_faults.end()) {
        ++found->second.times;
        found->second.platformBoard = platformBoard;
        return;
    }
    if (m_faults.size() >= m_capacity) {
        ++m_unlisted;
        return;
    }
    m_lastChange = Clock::now();
    m_faults.emplace(key, Fault{platformBoard, m_lastChange, std::time(nullptr), 1});
}

void FaultLog::clear(std::uint32_t boardIndex, int platformBoard, std::uint16_t value) {
    std::scoped_lock const guard(m_mutex);
    // The fault may have been raised before its board was known.
    auto const erased = m_faults.erase(keyOf(boardIndex, platformBoard, value)) +
                        m_faults.erase(keyOf(0, platformBoard, value));
    if (erased > 0) m_lastChange = Clock::now();
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
    read.lastChange = uptime.at(m_lastChange);
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
