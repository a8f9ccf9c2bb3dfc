// SPDX-License-Identifier: BSD-2-Clause
#include "IntervalRows.h"

#include <memory>
#include <random>

kvloamd::Snapshot makeIntervals(std::uint32_t lines) {
    kvloamd::Snapshot snapshot;
    std::mt19937 random(1);
    // Counters of all sizes, mostly small.
    std::exponential_distribution<double> counts(1.0 / 50);
    for (std::uint32_t i = 0; i < lines; ++i) {
        kvloamd::LineRow line;
        line.ifIndex = kFirstLine + i;
        auto const closed = std::make_shared<kvloamd::ClosedIntervals>();
        closed->valid.resize(kIntervalsOfALine, true);
        for (std::size_t n = 0; n < kIntervalsOfALine; ++n) {
            kvloamd::LineCounts interval{};
            for (std::int32_t& count : interval)
                count = static_cast<std::int32_t>(counts(random));
            closed->counts.push_back(interval);
        }
        line.closed = closed;
        snapshot.interfaces.lines.push_back(std::move(line));
    }
    countIntervals(snapshot.interfaces);
    return snapshot;
}
