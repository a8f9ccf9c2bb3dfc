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
/// Beyond it, other activity on the machine counts for more than the agent does.
constexpr double kLimitedShare = 0.999;
constexpr double kLargestDelay = 2;

using Times = std::vector<double>; ///< microseconds

Times ask(LeanClient& client, std::string const& request) {
    Times times;
    for (std::size_t i = 0; i < kRequestsOfATurn; ++i) {
        std::this_thread::sleep_for(kPause);
        auto const begun = std::chrono::steady_clock::now();
        client.ask(request);
        std::chrono::duration<double, std::micro> const time =
            std::chrono::steady_clock::now() - begun;
        times.push_back(time.count());
    }
    std::ranges::sort(times);
    return times;
}

/// The time within which this share of the requests, which are sorted, was answered.
double within(Times const& times, double share) {
    return times[static_cast<std::size_t>(share * static_cast<double>(times.size() - 1))];
}

void append(Times& all, Times const& times) {
    all.insert(all.end(), times.begin(), times.end());
}

void print(char const* what, Times times) {
    std::ranges::sort(times);
    std::printf("%-40s", what);
    for (double const share : kShares)
        std::printf(" %9.1f", within(times, share));
    std::printf("\n");
}

} // namespace

void reportDelays(int boards, Judgement& judgement) {
    std::fprintf(stderr, "measuring: delay of requests\n");
    ChassisAgent const stillAgent(boards, false);
    ChassisAgent const busyAgent(boards, true);
    LeanClient stillClient(stillAgent.port());
    LeanClient busyClient(busyAgent.port());
    std::string const request = requestsFor(kOurEntry, {kFirstCounterColumn}, 1).front();
    Times stillTimes;
    Times busyTimes;
    std::vector<double> delays;
    for (int turn = 0; turn < kTurns; ++turn) {
        Times const still = ask(stillClient, request);
        Times const busy = ask(busyClient, request);
        delays.push_back(within(busy, kLimitedShare) / within(still, kLimitedShare));
        append(stillTimes, still);
        append(busyTimes, busy);
    }
    std::printf("%-40s %9s %9s %9s %9s %9s\n", "one request, microseconds", "half", "90 %", "99 %",
                "99.9 %", "all");
    print("boards are not read", std::move(stillTimes));
    print("boards are read all the time", std::move(busyTimes));
    judgement.addRatio("a request while boards are read, at 99.9 %", "one while none are read",
                       spreadOf(delays), kLargestDelay);
}
