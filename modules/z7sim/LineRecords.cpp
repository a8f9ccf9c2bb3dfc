// SPDX-License-Identifier: BSD-2-Clause
#include "LineRecords.h"

#include <algorithm>

#include "LineScheduler.h"

LineRecords::~LineRecords() {
    clear();
}

LineRecord const& LineRecords::of(long device, LineFormat format) {
    auto const found = m_records.find(device);
    if (found != m_records.end()) {
        if (found->second.format == format) return found->second;
        release(found->second);
        m_records.erase(found);
    }
    if (!m_ticks) m_ticks = std::make_unique<LineTicks>(std::make_unique<PlatformBoard>(m_board));
    auto const source = std::make_shared<PlatformLine>(device);
    auto const state = std::make_shared<LineState>();
    ReferenceCounter<Z7SimIntervalTable> const intervals(new Z7SimIntervalTable(
        format, m_times, source, state, source->past(), Z7SimIntervalTable::Ticked::withBoard));
    LineRecord const& record = m_records[device] = {format, source, state, intervals};
    m_ticks->add(device, *record.intervals.get());
    return record;
}

void LineRecords::keepOnly(std::vector<long> const& devices) {
    if (devices.empty()) return;
    std::erase_if(m_records, [&](auto const& entry) {
        if (std::ranges::find(devices, entry.first) != devices.end()) return false;
        release(entry.second);
        return true;
    });
}

void LineRecords::suspend() {
    setSilent(true);
}

void LineRecords::resume() {
    setSilent(false);
}

void LineRecords::setSilent(bool silent) {
    for (auto const& [device, record] : m_records)
        record.source->setSilent(silent);
    if (m_ticks) m_ticks->askTogether(!silent);
}

void LineRecords::clear() {
    for (auto const& [device, record] : m_records)
        release(record);
    m_records.clear();
}

/// The table of a line that the board no longer has is ticked alone, as long as it has a handle.
void LineRecords::release(LineRecord const& record) {
    m_ticks->remove(*record.intervals.get());
    LineScheduler::instance().AddPeriodic(record.intervals.get(), 1);
}
