// SPDX-License-Identifier: BSD-2-Clause
#include "agent/readers/LongCounters.h"

#include <algorithm>
#include <chrono>

namespace kvloamd {

namespace {

/// What an interface of unknown speed is believed to be capable of, bit/s.
constexpr std::uint32_t kBelievedSpeed = 1'000'000'000;

/// The time of a reading is not exactly when the board was asked.
constexpr std::chrono::milliseconds kSlack{1000};

/// A packet has more octets.
constexpr std::uint64_t kShortestPacket = 16;

constexpr std::uint32_t low32(std::uint64_t number) {
    return static_cast<std::uint32_t>(number);
}

} // namespace

CountLimits countLimits(std::optional<std::uint32_t> speed, Clock::duration elapsed) {
    auto const time = std::chrono::duration_cast<std::chrono::milliseconds>(elapsed) + kSlack;
    auto const milliseconds =
        static_cast<std::uint64_t>(std::max(time, std::chrono::milliseconds::zero()).count());
    std::uint64_t const octets = speed.value_or(kBelievedSpeed) / 8U * milliseconds / 1000U;
    return {octets, octets / kShortestPacket};
}

bool hasRestarted(std::span<LongCounter const> totals, std::span<LongCounter const> read,
                  std::span<std::uint64_t const> limits) {
    for (std::size_t i = 0; i < read.size(); ++i) {
        if (!totals[i] || !read[i]) continue;
        std::uint32_t const former = low32(*totals[i]);
        std::uint32_t const now = low32(*read[i]);
        if (now < former && std::uint64_t{low32(std::uint64_t{now} - former)} > limits[i])
            return true;
    }
    return false;
}

void countOn(std::span<LongCounter> totals, std::span<LongCounter> read) {
    for (std::size_t i = 0; i < read.size(); ++i) {
        if (!read[i]) continue;
        if (totals[i]) {
            *totals[i] += low32(*read[i] - *totals[i]);
            read[i] = totals[i];
        } else {
            totals[i] = read[i];
        }
    }
}

} // namespace kvloamd
