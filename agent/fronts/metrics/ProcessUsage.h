// SPDX-License-Identifier: BSD-2-Clause
// What the agent's process uses of the host.
#pragma once

#include <cstdint>
#include <optional>

namespace kvloamd {

/// What is not known is absent.
struct ProcessUsage {
    std::optional<double> cpuSeconds;
    std::optional<std::int64_t> residentBytes;
    std::optional<std::int64_t> virtualBytes;
    std::optional<std::int64_t> threads;
    std::optional<std::int64_t> openDescriptors;
    std::optional<std::int64_t> mostDescriptors;
};

/// The usage of this process, from its files in /proc.
ProcessUsage readProcessUsage();

} // namespace kvloamd
