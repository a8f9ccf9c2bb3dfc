// SPDX-License-Identifier: BSD-2-Clause
// One process that uses the platform's runtime library as the agent serves it.
#pragma once

#include <array>
#include <cstdint>
#include <optional>
#include <string>

namespace kvloamd {

struct ProcessRow {
    std::uint32_t pid = 0;
    std::string name; ///< empty when it is not known
    std::uint32_t opens = 0;
    std::uint32_t closes = 0;
    std::optional<int> eventQueueSize; ///< none when the platform gives a negative number
    std::optional<int> currentEvents;
    std::optional<int> maxEvents;
    std::uint32_t totalEvents = 0;
    std::optional<int> handlers;

    std::array<std::uint32_t, 1> index() const { return {pid}; }
};

} // namespace kvloamd
