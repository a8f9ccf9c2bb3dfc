// SPDX-License-Identifier: BSD-2-Clause
#include "DelayReport.h"

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "Agents.h"
#include "IntervalRows.h"
#include "LeanClient.h"
#include "Requests.h"

namespace {

/// Of each kind, in turns: what the machine does beside comes and goes.
constexpr int kTurns = 10;
constexpr std::size_t kRequestsOfATurn = 1000;
/// Between two requests: a processor that is never free would have no time to read boards in.
constexpr std::chrono::microseconds kPause{500};
constexpr double kShares[] = {0.5, 0.9, 0.99, 0.999, 1};
/// Above it, what the machine does beside counts for more than the agent does.
constexpr std::size_t kLimitedShare = 3;

using Times = std::vector<double>; ///< microseconds

void ask(LeanClient& client, std::string const& request, Times& times) {
    for (std::size_t i = 0; i < kRequestsOfATurn; ++i) {
        std::this_thread::sleep_for(kPause);
        auto const begun = std::chrono::steady_clock::now();
        client.ask(request);
        std::chrono::duration<double, std::micro> const time =
            std::chrono::steady_clock::now() - begun;
        times.push_back(time.count());
    }
}

/// The times at kShares.
Times distribution(Times times) {
    std::ranges::sort(times);
    Times chosen;
    for (double const share : kShares)
        chosen.push_back(
            times[static_cast<std::size_t>(share * static_cast<double>(times.size() - 1))]);
    return chosen;
}

void print(char const* what, Times const& distribution) {
    std::printf("%-40s", what);
    for (double const time : distribution)
        std::printf(" %9.1f", time);
    std::printf("\n");
}

} // namespace

bool reportDelays(int boards) {
    ChassisAgent const stillAgent(boards, false);
    ChassisAgent const busyAgent(boards, true);
    LeanClient stillClient(stillAgent.port());
    LeanClient busyClient(busyAgent.port());
    std::string const request = requestsFor(kOurEntry, {kFirstCounterColumn}, 1).front();
    Times stillTimes;
    Times busyTimes;
    for (int turn = 0; turn < kTurns; ++turn) {
        ask(stillClient, request, stillTimes);
        ask(busyClient, request, busyTimes);
    }
    Times const still = distribution(std::move(stillTimes));
    Times const busy = distribution(std::move(busyTimes));
    std::printf("\n%-40s %9s %9s %9s %9s %9s\n", "one request, microseconds", "half", "90 %",
                "99 %", "99.9 %", "all");
    print("boards are not read", still);
    print("boards are read all the time", busy);
    bool const kept = busy[kLimitedShare] <= 2 * still[kLimitedShare];
    std::printf("delayed by %.2f of a request at 99.9 %% (limit: 1)%s\n",
                busy[kLimitedShare] / still[kLimitedShare] - 1, kept ? "" : "  EXCEEDED");
    return kept;
}
