// SPDX-License-Identifier: BSD-2-Clause
#include "DelayReport.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <vector>

#include "Agents.h"
#include "IntervalRows.h"
#include "LeanClient.h"
#include "Requests.h"

namespace {

constexpr std::size_t kRequests = 20000;
constexpr double kShares[] = {0.5, 0.9, 0.99, 0.999, 1};
/// Above it, what the machine does beside counts for more than the agent does.
constexpr std::size_t kLimitedShare = 2;

using Distribution = std::vector<double>; ///< microseconds at kShares

Distribution measure(Agent const& agent) {
    LeanClient client(agent.port());
    std::string const request = requestsFor(kOurEntry, {kFirstCounterColumn}, 1).front();
    std::vector<double> times(kRequests);
    for (double& time : times) {
        auto const begun = std::chrono::steady_clock::now();
        client.ask(request);
        time = std::chrono::duration<double, std::micro>(std::chrono::steady_clock::now() - begun)
                   .count();
    }
    std::ranges::sort(times);
    Distribution distribution;
    for (double const share : kShares)
        distribution.push_back(
            times[static_cast<std::size_t>(share * static_cast<double>(kRequests - 1))]);
    return distribution;
}

void print(char const* what, Distribution const& distribution) {
    std::printf("%-40s", what);
    for (double const time : distribution)
        std::printf(" %9.1f", time);
    std::printf("\n");
}

} // namespace

bool reportDelays(int boards) {
    Distribution const still = measure(ChassisAgent(boards, false));
    Distribution const busy = measure(ChassisAgent(boards, true));
    std::printf("\n%-40s %9s %9s %9s %9s %9s\n", "one request, microseconds", "half", "90 %",
                "99 %", "99.9 %", "all");
    print("boards are not read", still);
    print("boards are read all the time", busy);
    bool const kept = busy[kLimitedShare] <= 2 * still[kLimitedShare];
    std::printf("delayed by %.2f of a request at 99 %% (limit: 1)%s\n",
                busy[kLimitedShare] / still[kLimitedShare] - 1, kept ? "" : "  EXCEEDED");
    return kept;
}
