// SPDX-License-Identifier: BSD-2-Clause
#include "LineRecords.h"

#include <algorithm>

#include "Z7SimIntervalTable.h"

LineRecord const& LineRecords::of(long device, LineFormat format) {
    auto const found = m_records.find(device);
    if (found != m_records.end() && found->second.format == format) return found->second;
    auto const source = std::make_shared<PlatformLine>(device);
    auto const state = std::make_shared<LineState>();
    ReferenceCounter<DS1IntervalTable> const intervals(
        new Z7SimIntervalTable(format, m_times, source, state, source->past()));
    return m_records[device] = {format, source, state, intervals};
}

void LineRecords::keepOnly(std::vector<long> const& devices) {
    if (devices.empty()) return;
    std::erase_if(m_records, [&](auto const& entry) {
        return std::ranges::find(devices, entry.first) == devices.end();
    });
}

void LineRecords::suspend() {
    for (auto const& [device, record] : m_records)
        record.source->setSilent(true);
}

void LineRecords::resume() {
    for (auto const& [device, record] : m_records)
        record.source->setSilent(false);
}
