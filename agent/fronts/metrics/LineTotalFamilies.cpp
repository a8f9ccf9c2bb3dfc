// SPDX-License-Identifier: BSD-2-Clause
// The metrics of the totals of lines, which no object shows.
#include <cstdint>
#include <iterator>
#include <string>

#include "agent/fronts/metrics/MetricFamilies.h"
#include "agent/rows/InterfaceRows.h"

namespace kvloamd {

std::vector<MetricFamily> const& lineTotalFamilies() {
    static auto const all = [] {
        struct Total {
            char const* name;
            char const* unit;
            char const* help;
            std::int64_t factor = 1;
        };
        constexpr Total kTotals[] = {
            {"errored_seconds", "seconds", "Seconds with errors (ES)"},
            {"severely_errored_seconds", "seconds", "Seconds with many errors (SES)"},
            {"severely_errored_framing_seconds", "seconds",
             "Seconds with severe framing faults (SEFS)"},
            {"unavailable_seconds", "seconds", "Seconds in which the line was unavailable (UAS)"},
            {"controlled_slip_seconds", "seconds", "Seconds with controlled slips (CSS)"},
            {"path_coding_violations", "", "Path coding violations (PCV)"},
            {"line_errored_seconds", "seconds", "Seconds with line code violations (LES)"},
            {"bursty_errored_seconds", "seconds",
             "Seconds with some errors, between two thresholds (BES)"},
            {"degraded_seconds", "seconds", "Time in degraded minutes (DM)", 60},
            {"code_violations", "", "Line code violations (LCV)"},
        };
        static_assert(std::size(kTotals) == kLineCounters);
        std::vector<MetricFamily> families;
        for (Total const& total : kTotals) {
            MetricFamily& family = families.emplace_back();
            family.name = std::string("kvloam_line_") + total.name;
            family.type = MetricType::Counter;
            family.unit = total.unit;
            family.help = std::string(total.help) + ", counted when they are final";
            family.factor = total.factor;
        }
        return families;
    }();
    return all;
}

} // namespace kvloamd
