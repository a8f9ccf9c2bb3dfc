// SPDX-License-Identifier: BSD-2-Clause
#include "RatioReporter.h"

#include <cstdio>

void RatioReporter::ReportRuns(std::vector<Run> const& runs) {
    ConsoleReporter::ReportRuns(runs);
    for (Run const& run : runs) {
        if (run.error_occurred) continue;
        bool const repeated = run.repetitions > 1;
        if (repeated && run.aggregate_name != "median") continue;
        std::string name = run.run_name.str();
        double time = run.GetAdjustedRealTime();
        // With items counted, the time of one item is compared.
        if (auto const items = run.counters.find("items"); items != run.counters.end())
            time /= items->second;
        m_times[name] = time;
    }
}

bool RatioReporter::printRatios() const {
    bool kept = true;
    std::printf("\n%-58s %8s %8s\n", "cost of ours in units of the peer's", "ratio", "limit");
    for (auto const& [name, ours] : m_times) {
        auto const at = name.find("/ours");
        if (at == std::string::npos) continue;
        std::string peerName = name;
        peerName.replace(at, 5, "/peer");
        auto const peer = m_times.find(peerName);
        if (peer == m_times.end()) continue;
        double const ratio = ours / peer->second;
        std::string topic = name;
        topic.erase(at, 5);
        auto const limit = m_limits.find(topic);
        if (limit == m_limits.end()) {
            std::printf("%-58s %8.2f\n", topic.c_str(), ratio);
            continue;
        }
        bool const within = ratio <= limit->second;
        kept = kept && within;
        std::printf("%-58s %8.2f %8.2f%s\n", topic.c_str(), ratio, limit->second,
                    within ? "" : "  EXCEEDED");
    }
    return kept;
}
